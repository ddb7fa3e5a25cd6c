// PNG files give their stored sample values whatever their colour chunks say; 16-bit samples
// are rounded to 8 bits.
#include <png.h>

#include <algorithm>
#include <csetjmp>
#include <cstdio>
#include <cstring>

#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodePng;

struct PngChunks {
  double gamma = 0;  // file gamma for gAMA, 0 for none
  bool chromaticities = false;
  bool srgb = false;
  bool iccProfile = false;
};

// The smallest profile libpng accepts: a display profile header in RGB, no tags.
std::vector<std::uint8_t> EmptyRgbProfile() {
  std::vector<std::uint8_t> p(132, 0);
  const auto put = [&](std::size_t at, const char* bytes, std::size_t n = 4) {
    std::memcpy(&p[at], bytes, n);
  };
  put(0, "\0\0\0\x84");  // size 132
  put(8, "\x02\x10\0\0");
  put(12, "mntr");
  put(16, "RGB ");
  put(20, "XYZ ");
  put(36, "acsp");
  put(68, "\0\0\xF6\xD6\0\x01\0\0\0\0\xD3\x2D", 12);  // the D50 white point
  return p;
}

// samples holds width * height * channels values of bitDepth bits, row by row.
std::vector<std::uint8_t> WritePng(int width, int height, int colourType, int bitDepth,
                                   const std::vector<std::uint16_t>& samples, PngChunks chunks,
                                   bool interlaced = false,
                                   const std::vector<png_color>& palette = {},
                                   const std::vector<png_byte>& opacity = {}) {
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  std::vector<std::uint8_t> out;
  png_set_write_fn(
      png, &out,
      [](png_structp p, png_bytep data, png_size_t size) {
        auto* o = static_cast<std::vector<std::uint8_t>*>(png_get_io_ptr(p));
        o->insert(o->end(), data, data + size);
      },
      nullptr);
  png_set_IHDR(png, info, width, height, bitDepth, colourType,
               interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
               PNG_FILTER_TYPE_DEFAULT);
  if (chunks.gamma > 0) png_set_gAMA(png, info, chunks.gamma);
  if (chunks.chromaticities) png_set_cHRM(png, info, 0.3, 0.3, 0.7, 0.25, 0.2, 0.7, 0.1, 0.05);
  if (chunks.srgb) png_set_sRGB(png, info, PNG_sRGB_INTENT_PERCEPTUAL);
  const std::vector<std::uint8_t> profile = EmptyRgbProfile();
  if (chunks.iccProfile) {
    png_set_iCCP(png, info, "empty", 0, profile.data(), static_cast<png_uint_32>(profile.size()));
  }
  if (!palette.empty()) png_set_PLTE(png, info, palette.data(), static_cast<int>(palette.size()));
  if (!opacity.empty()) {
    png_set_tRNS(png, info, opacity.data(), static_cast<int>(opacity.size()), nullptr);
  }
  png_write_info(png, info);
  if (bitDepth == 16) png_set_swap(png);
  // Samples in the machine's byte order (png_set_swap above), rows one after another.
  std::vector<std::uint8_t> bytes;
  for (std::uint16_t v : samples) {
    bytes.push_back(static_cast<std::uint8_t>(v));
    if (bitDepth == 16) bytes.push_back(static_cast<std::uint8_t>(v >> 8));
  }
  std::vector<png_bytep> rows;
  for (int y = 0; y < height; ++y) rows.push_back(&bytes[y * bytes.size() / height]);
  png_write_image(png, rows.data());
  png_write_end(png, info);
  png_destroy_write_struct(&png, &info);
  return out;
}

std::uint8_t To8(std::uint16_t v, int bitDepth) {
  return bitDepth == 16 ? static_cast<std::uint8_t>((v * 255u + 32767u) / 65535u)
                        : static_cast<std::uint8_t>(v);
}

std::vector<std::uint16_t> Samples(std::size_t count, int bitDepth, unsigned seed) {
  std::vector<std::uint16_t> s(count);
  std::uint32_t state = seed;
  for (auto& v : s) {
    state = state * 1664525u + 1013904223u;
    v = static_cast<std::uint16_t>(state >> (bitDepth == 16 ? 16 : 24));
  }
  return s;
}

TEST(PngStoredValues, ColourChunksChangeNoSample) {
  struct Case {
    const char* name;
    int colourType, bitDepth;
    PngChunks chunks;
    bool interlaced;
  };
  const Case cases[] = {
      // clang-format off
      {"rgb8 gamma 1.0 + cHRM", PNG_COLOR_TYPE_RGB, 8, {.gamma = 1.0, .chromaticities = true}, false},
      {"rgb8 gamma 0.2 interlaced", PNG_COLOR_TYPE_RGB, 8, {.gamma = 0.2}, true},
      {"rgb8 ICC profile", PNG_COLOR_TYPE_RGB, 8, {.iccProfile = true}, false},
      {"gray8 gamma 2.0", PNG_COLOR_TYPE_GRAY, 8, {.gamma = 2.0}, false},
      {"rgba8 gamma 0.7", PNG_COLOR_TYPE_RGBA, 8, {.gamma = 0.7}, false},
      {"rgba16 sRGB", PNG_COLOR_TYPE_RGBA, 16, {.srgb = true}, false},
      {"rgb16 gamma 1.0 interlaced", PNG_COLOR_TYPE_RGB, 16, {.gamma = 1.0}, true},
      {"gray+alpha16 gamma 0.3", PNG_COLOR_TYPE_GRAY_ALPHA, 16, {.gamma = 0.3}, false},
      // clang-format on
  };
  constexpr int w = 13, h = 9;
  for (const Case& c : cases) {
    const int channels = 1 + (c.colourType & PNG_COLOR_MASK_COLOR ? 2 : 0) +
                         (c.colourType & PNG_COLOR_MASK_ALPHA ? 1 : 0);
    const auto samples = Samples(std::size_t{w} * h * channels, c.bitDepth, w * channels);
    const std::vector<std::uint8_t> file =
        WritePng(w, h, c.colourType, c.bitDepth, samples, c.chunks, c.interlaced);
    if (c.chunks.iccProfile) {
      ASSERT_TRUE(Contains(std::string(file.begin(), file.end()), "iCCP"));  // libpng took it
    }
    const Bitmap32 picture = DecodePng(file);
    ASSERT_EQ(picture.Width(), w) << c.name;
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x) {
        const std::uint16_t* s = &samples[(static_cast<std::size_t>(y) * w + x) * channels];
        const bool gray = channels <= 2;
        const bool alpha = channels % 2 == 0;
        const Pixel want{To8(s[gray ? 0 : 2], c.bitDepth), To8(s[gray ? 0 : 1], c.bitDepth),
                         To8(s[0], c.bitDepth),
                         alpha ? To8(s[channels - 1], c.bitDepth) : std::uint8_t{255}};
        ASSERT_EQ(picture.At(x, y), want) << c.name << " at " << x << "," << y;
      }
  }
}

// Every 16-bit value once, in a gray file with a gamma chunk.
TEST(PngStoredValues, SixteenBitSamplesRoundToTheNearestLevel) {
  std::vector<std::uint16_t> all(65536);
  for (std::size_t v = 0; v < all.size(); ++v) all[v] = static_cast<std::uint16_t>(v);
  const Bitmap32 picture =
      DecodePng(WritePng(256, 256, PNG_COLOR_TYPE_GRAY, 16, all, {.gamma = 0.45455}));
  for (int v = 0; v < 65536; ++v) {
    const std::uint8_t want = To8(static_cast<std::uint16_t>(v), 16);
    ASSERT_EQ(picture.At(v % 256, v / 256), (Pixel{want, want, want, 255})) << v;
  }
}

TEST_F(TempFolder, PaletteFileWithGammaKeepsItsColoursThroughASaveAndLoad) {
  const std::vector<png_color> palette = {{10, 200, 30}, {255, 254, 1}, {128, 64, 32}};
  const std::vector<png_byte> opacity = {255, 100};
  WriteBytes(Path("a.png"), WritePng(3, 2, PNG_COLOR_TYPE_PALETTE, 8, {0, 1, 2, 2, 1, 0},
                                     {.gamma = 1.0}, false, palette, opacity));
  const Bitmap32 loaded = *LoadPng(Path("a.png"));
  EXPECT_EQ(loaded.At(0, 0), (Pixel{30, 200, 10, 255}));
  EXPECT_EQ(loaded.At(1, 0), (Pixel{1, 254, 255, 100}));
  EXPECT_EQ(loaded.At(2, 0), (Pixel{32, 64, 128, 255}));
  SavePng(loaded, Path("b.png"));
  EXPECT_EQ(*LoadPng(Path("b.png")), loaded);
}

// A damaged file is refused with libpng's reason, whatever part of it is broken.
TEST(PngStoredValues, DamagedFilesAreRefused) {
  const std::vector<std::uint8_t> good =
      WritePng(16, 16, PNG_COLOR_TYPE_RGB, 8, Samples(16 * 16 * 3, 8, 5), {.gamma = 1.0});
  ASSERT_EQ(DecodePng(good).Width(), 16);
  auto find = [&](const char* type) {
    return static_cast<std::size_t>(std::search(good.begin(), good.end(), type, type + 4) -
                                    good.begin());
  };
  const std::size_t idat = find("IDAT"), iend = find("IEND");
  std::vector<std::vector<std::uint8_t>> broken(5, good);
  broken[0][1] = 'Q';            // signature
  broken[1][8 + 4 + 4 + 8] = 3;  // IHDR bit depth 3, its checksum now wrong too
  broken[2][iend - 8] ^= 0x40;   // the checksum of the image data
  broken[3].resize(idat + 20);   // cut inside the image data
  broken[4].erase(broken[4].begin() + static_cast<std::ptrdiff_t>(idat - 4),
                  broken[4].begin() + static_cast<std::ptrdiff_t>(iend - 4));  // no IDAT
  for (std::size_t i = 0; i < broken.size(); ++i) {
    const std::string error = ErrorOf([&] { DecodePng(broken[i]); });
    EXPECT_TRUE(Contains(error, "PNG")) << i << ": " << error;
  }
}

}  // namespace
}  // namespace quillane::testing
