// Bitmaps, icons and GIFs built byte by byte: how the wrapper around Qt's readers detects,
// converts and refuses them.
#include <array>

#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodeWithQt;
using codecs::QtFormat;

Bitmap32 Bmp(const std::vector<std::uint8_t>& file) {
  return DecodeWithQt(file, QtFormat::kBitmap);
}

// Palette entries are B, G, R, reserved.
const std::vector<std::uint8_t> kPalette = {0, 0, 0, 0, 0, 0, 255, 0, 0, 255, 0, 0, 255, 0, 0, 0};

// Paletted, compressed and deep pictures all become opaque 32-bit pixels (the unused fourth byte
// of a 32-bit one is not alpha); a top-down picture's negative height passes the size checks.
TEST(BitmapDecoder, ConvertsPalettedCompressedAndDeepPicturesAndBothRowOrders) {
  const std::vector<std::uint8_t> rle8 = {1, 0, 1, 1, 1, 0, 0, 0, 0, 3, 1, 2, 3, 0, 0, 1};
  const std::pair<const char*, std::vector<std::uint8_t>> cases[] = {
      // Indices 0 black, 1 red, 2 green, 3 blue; rows bottom first unless the height is negative.
      {"8 bits", BmpFile(BmpInfoHeader(40, 3, 2, 8, 0, 8, 4), kPalette, {0, 1, 0, 0, 1, 2, 3, 0})},
      {"top-down",
       BmpFile(BmpInfoHeader(40, 3, -2, 8, 0, 8, 4), kPalette, {1, 2, 3, 0, 0, 1, 0, 0})},
      {"32 bits",
       BmpFile(BmpInfoHeader(40, 3, 2, 32, 0, 24), {},
               {0, 0, 0, 9, 0, 0, 255, 9, 0, 0, 0, 9, 0, 0, 255, 9, 0, 255, 0, 9, 255, 0, 0, 9})},
      {"RLE8", BmpFile(BmpInfoHeader(40, 3, 2, 8, 1, rle8.size(), 4), kPalette, rle8)}};
  for (const auto& [what, file] : cases) {
    SCOPED_TRACE(what);
    const Bitmap32 p = Bmp(file);
    ASSERT_EQ(p.Width(), 3);
    ASSERT_EQ(p.Height(), 2);
    const Pixel want[2][3] = {{kRed, kGreen, kBlue}, {kBlack, kRed, kBlack}};
    for (int y = 0; y < 2; ++y)
      for (int x = 0; x < 3; ++x) EXPECT_EQ(p.At(x, y), want[y][x]) << x << "," << y;
  }
}

// Unlike an icon's, a bitmap's alpha is kept as stored, not painted over white.
TEST(BitmapDecoder, KeepsTheAlphaOfAVersion5Header) {
  const std::vector<std::uint8_t> bits = {0, 0, 255, 255, 0, 255, 0, 128, 255, 0, 0, 0};
  const Bitmap32 p = Bmp(BmpFile(
      BmpInfoHeader(124, 3, 1, 32, 3, 12, 0, {0xFF0000, 0xFF00, 0xFF, 0xFF000000}), {}, bits));
  ASSERT_EQ(p.Width(), 3);
  EXPECT_EQ(p.At(0, 0), kRed);
  EXPECT_EQ(p.At(1, 0), (Pixel{0, 255, 0, 128}));
  EXPECT_EQ(p.At(2, 0), (Pixel{255, 0, 0, 0}));
}

TEST(BitmapDecoder, RefusesHostileHeadersAndDamage) {
  const std::vector<std::uint8_t> bits(64, 0);
  for (const auto& [w, h] : {std::pair{100000, 100000}, {0, 2}, {3, 0}, {-3, 2}, {70000, 70000}}) {
    EXPECT_THROW(Bmp(BmpFile(BmpInfoHeader(40, w, h, 24, 0, 0), {}, bits)), PictureFileError)
        << w << "x" << h;
  }
  // A picture within Qt's own limits but beyond ours is refused from the header.
  EXPECT_THROW(DecodeWithQt(BmpFile(BmpInfoHeader(40, 100, 100, 24, 0, 0), {}, bits),
                            QtFormat::kBitmap, 9999),
               PictureFileError);
  // Bits missing.
  const std::vector<std::uint8_t> full =
      BmpFile(BmpInfoHeader(40, 30, 20, 24, 0, 0), {}, std::vector<std::uint8_t>(90 * 20, 7));
  const std::vector<std::uint8_t> cut(full.begin(), full.begin() + 54 + 90 * 5);
  EXPECT_THROW(Bmp(cut), PictureFileError);
  // Another format under this name.
  EXPECT_THROW(Bmp({0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A, 0, 0, 0, 0}), PictureFileError);
  EXPECT_THROW(Bmp({}), PictureFileError);
}

// An icon entry: a 32-bit image of one colour, optionally with some alpha, or a paletted one.
struct IconImage {
  int size;
  int bitCount;
  Pixel colour;
};

std::vector<std::uint8_t> IcoFile(const std::vector<IconImage>& images) {
  std::vector<std::vector<std::uint8_t>> bodies;
  for (const IconImage& image : images) {
    const int n = image.size;
    const int maskStride = ((n + 31) / 32) * 4;
    ByteWriter body;
    body.Append(BmpInfoHeader(40, n, 2 * n, image.bitCount, 0, 0));
    if (image.bitCount == 32) {
      for (int y = 0; y < n; ++y) {
        for (int x = 0; x < n; ++x) {
          // Stored bottom-up; the top-left pixel (last row, first column) is transparent and
          // its neighbour half transparent.
          const bool top = y == n - 1;
          const std::uint8_t alpha = top && x == 0 ? 0 : top && x == 1 ? 128 : 255;
          body.U8(image.colour.b).U8(image.colour.g).U8(image.colour.r).U8(alpha);
        }
      }
    } else {  // 8 bits: palette entry 1 is the colour
      body.U8(0).U8(0).U8(0).U8(0).U8(image.colour.b).U8(image.colour.g).U8(image.colour.r).U8(0);
      for (int i = 2; i < 256; ++i) body.U32(0);
      for (int y = 0; y < n; ++y) {
        for (int x = 0; x < n; ++x) body.U8(1);
      }
    }
    for (int i = 0; i < maskStride * n; ++i) body.U8(0);
    bodies.push_back(body.bytes);
  }
  ByteWriter file;
  file.U16(0).U16(1).U16(static_cast<unsigned>(images.size()));
  std::uint32_t offset = static_cast<std::uint32_t>(6 + 16 * images.size());
  for (std::size_t i = 0; i < images.size(); ++i) {
    const int n = images[i].size;
    file.U8(n == 256 ? 0 : n).U8(n == 256 ? 0 : n).U8(0).U8(0).U16(1).U16(images[i].bitCount);
    file.U32(static_cast<std::uint32_t>(bodies[i].size())).U32(offset);
    offset += static_cast<std::uint32_t>(bodies[i].size());
  }
  for (const auto& body : bodies) file.Append(body);
  return file.bytes;
}

TEST(IconDecoder, TakesTheLargestDeepestEntryAndPaintsTransparencyWhite) {
  const std::vector<std::uint8_t> file =
      IcoFile({{16, 32, kBlue}, {32, 8, kGreen}, {32, 32, kRed}, {24, 32, kBlue}});
  const Bitmap32 icon = DecodeWithQt(file, QtFormat::kIcon);
  ASSERT_EQ(icon.Width(), 32);
  ASSERT_EQ(icon.Height(), 32);
  EXPECT_EQ(icon.At(5, 5), kRed);
  EXPECT_EQ(icon.At(31, 31), kRed);
  // Transparent: white, alpha as the icon has it; half transparent: red over white.
  EXPECT_EQ(icon.At(0, 0), (Pixel{255, 255, 255, 0}));
  EXPECT_EQ(icon.At(1, 0), (Pixel{127, 127, 255, 128}));
  // Of two equally large entries the deeper one wins, wherever it is listed.
  const Bitmap32 deeper =
      DecodeWithQt(IcoFile({{32, 32, kBlue}, {32, 8, kGreen}}), QtFormat::kIcon);
  EXPECT_EQ(deeper.At(5, 5), kBlue);
}

TEST(IconDecoder, RefusesDamagedFiles) {
  const std::vector<std::uint8_t> file = IcoFile({{16, 32, kBlue}});
  const std::vector<std::uint8_t> cut(file.begin(), file.begin() + 30);
  EXPECT_THROW(DecodeWithQt(cut, QtFormat::kIcon), PictureFileError);
  EXPECT_THROW(DecodeWithQt(std::vector<std::uint8_t>{0, 0, 1, 0, 0, 0}, QtFormat::kIcon),
               PictureFileError);
  // Found by fuzzing: a directory of 65535 entries in a file of one; Qt looked at (and warned
  // about) each, some tens of milliseconds an icon.
  std::vector<std::uint8_t> many = file;
  many[4] = many[5] = 0xFF;
  EXPECT_THROW(DecodeWithQt(many, QtFormat::kIcon), PictureFileError);
}

const std::vector<std::uint8_t> kGifPalette = {255, 0, 0, 0, 255, 0, 0, 0, 255, 0, 0, 0};

TEST(GifDecoder, TransparentPixelsAndUncoveredScreenBecomeWhite) {
  // A 4 x 3 screen with a 2 x 2 frame at (1, 1) whose index 3 is transparent.
  const Bitmap32 p =
      DecodeWithQt(GifFile(4, 3, 1, 1, 2, 2, kGifPalette, {0, 3, 1, 2}, 3), QtFormat::kGif);
  ASSERT_EQ(p.Width(), 4);
  ASSERT_EQ(p.Height(), 3);
  EXPECT_EQ(p.At(1, 1), kRed);
  EXPECT_EQ(p.At(1, 2), kGreen);
  EXPECT_EQ(p.At(2, 2), kBlue);
  EXPECT_EQ(p.At(2, 1), (Pixel{255, 255, 255, 0}));
  EXPECT_EQ(p.At(0, 0), (Pixel{255, 255, 255, 0}));
  EXPECT_EQ(p.At(3, 2), (Pixel{255, 255, 255, 0}));
}

// The screen is what the picture is (transparent where the frame does not cover it), as long as the
// file's frame is evidence enough for it: up to 4 megapixels of screen, or four times the frame.
// Beyond that a 27 KB file once took gigabytes; the screen is cut to the frame's corner, or to the
// frame alone.
TEST(GifDecoder, ScreenIsHonouredWithinWhatTheFrameBacks) {
  struct Case {
    int sw, sh, x, y, w, h;  // screen, then the frame's place and size
    int width, height;       // the picture
    int frameX, frameY;      // where the frame lands in it
  } cases[] = {
      {2048, 2048, 5, 6, 1, 1, 2048, 2048, 5, 6},                // small enough to need no evidence
      {3000, 3000, 0, 0, 1000, 1000, 1000, 1000, 0, 0},          // 9 times the frame: cut to it
      {3000, 3000, 1990, 10, 1000, 1000, 2990, 1010, 1990, 10},  // cut to the frame's corner
      {8200, 6200, 8199, 6199, 1, 1, 1, 1, 0, 0},  // a pixel in a corner: only the frame
      {16000, 16000, 0, 0, 1, 1, 1, 1, 0, 0},
      {65535, 65535, 65534, 65534, 1, 1, 1, 1, 0, 0},
  };
  for (const Case& c : cases) {
    const std::uint64_t pixels = std::uint64_t(c.w) * c.h;
    const Bitmap32 p = DecodeWithQt(
        GifFileWithData(c.sw, c.sh, c.x, c.y, c.w, c.h, kGifPalette, 2, LzwUniform(pixels, 1, 2)),
        QtFormat::kGif);
    ASSERT_EQ(p.Width(), c.width) << c.sw << " x " << c.sh;
    ASSERT_EQ(p.Height(), c.height) << c.sw << " x " << c.sh;
    EXPECT_EQ(p.At(c.frameX, c.frameY), kGreen);
    EXPECT_EQ(p.At(c.frameX + c.w - 1, c.frameY + c.h - 1), kGreen);
    // No colour is transparent here, and still the rest of the screen is (Qt would fill it with
    // the background colour).
    if (c.frameX > 0) {
      EXPECT_EQ(p.At(0, 0), (Pixel{255, 255, 255, 0}));
    }
  }
}

// Qt's reader refuses images above its own process-wide allocation limit (128 MB by default);
// a 50-megapixel GIF needs 203 MB in 32 bits and must open like any photo.
TEST(GifDecoder, FiftyMegapixelPictureOpens) {
  const Bitmap32 p = DecodeWithQt(
      GifFileWithData(8200, 6200, 0, 0, 8200, 6200, kGifPalette, 2, LzwUniform(8200 * 6200, 2, 2)),
      QtFormat::kGif);
  ASSERT_EQ(p.Width(), 8200);
  ASSERT_EQ(p.Height(), 6200);
  EXPECT_EQ(p.At(8199, 6199), kBlue);
}

// Codes of up to 12 bits are legal, so a minimum code size of 9 to 11 decodes; 12 leaves no room.
TEST(GifDecoder, MinimumCodeSizesUpToElevenDecode) {
  for (int codeSize : {2, 8, 9, 11}) {
    const Bitmap32 p = DecodeWithQt(
        GifFile(3, 2, 0, 0, 3, 2, kGifPalette, {0, 1, 2, 2, 1, 0}, -1, codeSize), QtFormat::kGif);
    ASSERT_EQ(p.Width(), 3) << codeSize;
    EXPECT_EQ(p.At(0, 0), kRed) << codeSize;
    EXPECT_EQ(p.At(2, 0), kBlue) << codeSize;
    EXPECT_EQ(p.At(0, 1), kBlue) << codeSize;
    EXPECT_EQ(p.At(2, 1), kRed) << codeSize;
  }
}

// Another signature and a code size of 12 once loaded (one as an all-white picture); frames
// whose data cannot give their pixels are damaged (huge ones: crafted_size_test).
TEST(GifDecoder, RefusesForeignSignaturesWideCodesAndFramesTheDataCannotFill) {
  const std::vector<std::uint8_t> good =
      GifFile(3, 3, 0, 0, 3, 3, kGifPalette, std::vector<std::uint8_t>(9, 1), -1);
  std::vector<std::uint8_t> foreign = good, wide = good;
  foreign[4] = '8';  // GIF88a
  wide[35] = 12;     // the code size byte after the 4-colour table and the frame header
  const std::pair<std::vector<std::uint8_t>, const char*> cases[] = {
      {GifFile(3, 3, 0, 0, 3, 3, kGifPalette, {1, 2, 0, 1}, -1), "gives 4 of"},
      {foreign, "neither GIF87a nor GIF89a"},
      {wide, "12 bits or more"},
      {std::vector<std::uint8_t>(good.begin(), good.begin() + 10), "inside its header"}};
  for (const auto& [bytes, reason] : cases) {
    const std::string error = ErrorOf([&] { DecodeWithQt(bytes, QtFormat::kGif); });
    EXPECT_TRUE(Contains(error, reason)) << reason << ": " << error;
  }
}

}  // namespace
}  // namespace quillane::testing
