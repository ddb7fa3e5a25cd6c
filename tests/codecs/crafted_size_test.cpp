// Files of a few bytes whose headers announce enormous pictures, written to disk and opened as a
// user would: each decoder must refuse them as damaged from what the file holds, before the
// picture is allocated. Also the picture size limit and how its message says to raise it.
#include <zlib.h>

#include <string>
#include <vector>

#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

// A PNG file of the given header size around idat as its only picture data.
std::vector<std::uint8_t> PngFile(std::uint32_t width, std::uint32_t height,
                                  const std::vector<std::uint8_t>& idat) {
  std::vector<std::uint8_t> file = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
  const auto chunk = [&](const char* type, const std::vector<std::uint8_t>& body) {
    const auto big32 = [&](std::uint32_t v) {
      for (int s = 24; s >= 0; s -= 8) file.push_back(static_cast<std::uint8_t>(v >> s));
    };
    big32(static_cast<std::uint32_t>(body.size()));
    const std::size_t start = file.size();
    file.insert(file.end(), type, type + 4);
    file.insert(file.end(), body.begin(), body.end());
    big32(static_cast<std::uint32_t>(::crc32(0, file.data() + start, file.size() - start)));
  };
  std::vector<std::uint8_t> header;
  for (std::uint32_t v : {width, height})
    for (int s = 24; s >= 0; s -= 8) header.push_back(static_cast<std::uint8_t>(v >> s));
  header.insert(header.end(), {8, 0, 0, 0, 0});  // 8-bit gray, not interlaced
  chunk("IHDR", header);
  chunk("IDAT", idat);
  chunk("IEND", {});
  return file;
}

// B, G, R, 0 of blue, green, red and white.
const std::vector<std::uint8_t> kPalette4 = {255, 0, 0,   0, 0,   255, 0,   0,
                                             0,   0, 255, 0, 255, 255, 255, 0};

class CraftedSizes : public TempFolder {
 protected:
  // The message of opening bytes saved under name (LoadPng for .png).
  std::string OpenError(const std::string& name, const std::vector<std::uint8_t>& bytes) {
    WriteBytes(Path(name), bytes);
    return ErrorOf([&] {
      if (name.ends_with(".png")) {
        LoadPng(Path(name));
      } else {
        LoadPictureFile(Path(name));
      }
    });
  }
};

TEST_F(CraftedSizes, TinyFilesAnnouncingHugePicturesAreDamaged) {
  // End of bitmap at once, or a few runs and jumps: nothing of 16384 x 16384 is drawn.
  const std::vector<std::uint8_t> endOnly = {0, 1};
  std::vector<std::uint8_t> jumps = {255, 1, 255, 2};
  for (int i = 0; i < 60; ++i) jumps.insert(jumps.end(), {0, 2, 255, 255});
  jumps.insert(jumps.end(), {0, 1});
  // 12 bytes of picture data against 268 MB of 16384 x 16384 gray rows.
  const std::vector<std::uint8_t> zlibBits = {0x78, 0x9C, 0x63, 0x60, 0x18, 0x05,
                                              0x00, 0x00, 0x00, 0x65, 0x00, 0x01};
  const std::vector<std::uint8_t> kGifPalette = {255, 0, 0, 0, 255, 0, 0, 0, 255, 0, 0, 0};
  const struct {
    const char* name;
    std::vector<std::uint8_t> bytes;
    const char* reason;
  } cases[] = {
      {"rle8.bmp", BmpFile(BmpInfoHeader(40, 16384, 16384, 8, 1, 2, 4), kPalette4, endOnly),
       "draws 0 of its 16384 by 16384 pixels"},
      {"rle4.bmp", BmpFile(BmpInfoHeader(40, 16384, 16384, 4, 2, 2, 4), kPalette4, endOnly),
       "draws 0 of"},
      {"top-down.bmp", BmpFile(BmpInfoHeader(40, 16384, -16384, 8, 1, 2, 4), kPalette4, jumps),
       "draws 510 of"},
      {"frame.gif", GifFile(12000, 12000, 0, 0, 12000, 12000, kGifPalette, {1}, -1),
       "gives 1 of the first frame's 12000 by 12000"},
      {"wide.gif", GifFile(65535, 4096, 0, 0, 65535, 4096, kGifPalette, {1, 1}, -1), "gives 2 of"},
      {"short.png", PngFile(16384, 16384, zlibBits), "cannot hold a picture of 16384 by 16384"},
  };
  for (const auto& c : cases) {
    const std::string error = OpenError(c.name, c.bytes);
    EXPECT_TRUE(Contains(error, c.reason))
        << c.name << " (" << c.bytes.size() << " bytes): " << error;
  }
}

// A flat picture compresses as well as the formats allow, and must still open.
TEST_F(CraftedSizes, FilesAsCompactAsTheFormatAllowsStillOpen) {
  const Bitmap32 flat(3000, 2000, kBlue);
  WriteBytes(Path("flat.png"), codecs::EncodePng(flat));
  const std::optional<Bitmap32> png = LoadPng(Path("flat.png"));
  ASSERT_TRUE(png);
  EXPECT_EQ(png->Width(), 3000);
  EXPECT_EQ(png->At(2999, 1999), kBlue);

  // Runs of 255 pixels, each row ended: as dense as run-length coding gets.
  std::vector<std::uint8_t> runs;
  for (int y = 0; y < 40; ++y) {
    for (int x = 0; x < 4; ++x) runs.insert(runs.end(), {255, 0});
    runs.insert(runs.end(), {0, 0});
  }
  runs.insert(runs.end(), {0, 1});
  WriteBytes(Path("runs.bmp"),
             BmpFile(BmpInfoHeader(40, 1020, 40, 8, 1, static_cast<std::uint32_t>(runs.size()), 4),
                     kPalette4, runs));
  const std::optional<Bitmap32> bmp = LoadPictureFile(Path("runs.bmp"));
  ASSERT_TRUE(bmp);
  EXPECT_EQ(bmp->At(1019, 39), kBlue);
}

TEST_F(CraftedSizes, LimitIsTheOneSetAndItsMessageSaysHowToRaiseIt) {
  const std::vector<std::uint8_t> bits(64 * 64 * 3, 0);
  WriteBytes(Path("64.bmp"), BmpFile(BmpInfoHeader(40, 64, 64, 24, 0, 0), {}, bits));
  struct Restore {
    ~Restore() { SetMaxPicturePixels(kDefaultMaxPicturePixels); }
  } restore;
  SetMaxPicturePixels(4095);
  const std::string error = ErrorOf([&] { LoadPictureFile(Path("64.bmp")); });
  EXPECT_TRUE(Contains(error, "64 by 64 pixels, more than the 4095 pixels")) << error;
  EXPECT_TRUE(Contains(error, "--max-pixels 4096 raises the limit, up to 268435456")) << error;
  SetMaxPicturePixels(4096);
  EXPECT_EQ(LoadPictureFile(Path("64.bmp"))->Width(), 64);
  // Beyond what a bitmap can hold, the limit cannot be raised.
  SetMaxPicturePixels(std::int64_t{1} << 40);
  EXPECT_EQ(MaxPicturePixels(), Bitmap32::kMaxPixels);
}

// Standard input has no name: the content alone chooses the decoder, with its checks.
TEST(DecodeByContent, ChoosesTheDecoderByTheFirstBytes) {
  const Bitmap32 blue(5, 4, kBlue);
  codecs::MemorySink bmp;
  codecs::EncodeBitmap24(blue, bmp);
  for (const std::vector<std::uint8_t>& bytes :
       {codecs::EncodePng(blue), codecs::EncodeJpeg(blue, 100), bmp.bytes()}) {
    const Bitmap32 p = codecs::DecodeByContent(bytes);
    ASSERT_EQ(p.Width(), 5);
    EXPECT_NEAR(p.At(4, 3).b, 255, 2);
  }
  EXPECT_TRUE(Contains(ErrorOf([] {
                         codecs::DecodeByContent(PngFile(16384, 16384, {0, 0}));
                       }),
                       "cannot hold"));
  EXPECT_TRUE(Contains(ErrorOf([] {
                         codecs::DecodeByContent(std::vector<std::uint8_t>{'t', 'e', 'x', 't'});
                       }),
                       "not a picture of any type the program reads"));
}

}  // namespace
}  // namespace quillane::testing
