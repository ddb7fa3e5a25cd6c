// JPEG decoding of baseline, progressive, gray and ink files, and refusal of broken ones.
#include <cstddef>
#include <cstdio>
// clang-format off
#include <jpeglib.h>
// clang-format on

#include <algorithm>
#include <cstdlib>

#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodeJpeg;

struct JpegOptions {
  J_COLOR_SPACE input = JCS_RGB;  // JCS_RGB, JCS_GRAYSCALE or JCS_CMYK
  J_COLOR_SPACE stored = JCS_YCbCr;
  bool progressive = false;
  int lumaH = 2, lumaV = 2;  // sampling factors of the first component
  int restartRows = 0;
  int quality = 95;
  bool arithmetic = false;
  std::vector<jpeg_scan_info> scans;  // a scan script of one's own (progressive)
};

// Encodes width x height samples given per pixel by sample(x, y, channel).
template <typename Sample>
std::vector<std::uint8_t> WriteJpeg(int width, int height, const JpegOptions& options,
                                    Sample sample) {
  jpeg_compress_struct cinfo{};
  jpeg_error_mgr err{};
  cinfo.err = jpeg_std_error(&err);
  jpeg_create_compress(&cinfo);
  unsigned char* buffer = nullptr;
  unsigned long size = 0;
  jpeg_mem_dest(&cinfo, &buffer, &size);
  cinfo.image_width = width;
  cinfo.image_height = height;
  cinfo.in_color_space = options.input;
  cinfo.input_components = options.input == JCS_GRAYSCALE ? 1 : options.input == JCS_CMYK ? 4 : 3;
  jpeg_set_defaults(&cinfo);
  jpeg_set_colorspace(&cinfo, options.stored);
  jpeg_set_quality(&cinfo, options.quality, TRUE);
  if (cinfo.num_components > 1) {
    cinfo.comp_info[0].h_samp_factor = options.lumaH;
    cinfo.comp_info[0].v_samp_factor = options.lumaV;
    for (int c = 1; c < cinfo.num_components; ++c) {
      cinfo.comp_info[c].h_samp_factor = c == 3 ? options.lumaH : 1;
      cinfo.comp_info[c].v_samp_factor = c == 3 ? options.lumaV : 1;
    }
  }
  cinfo.restart_in_rows = options.restartRows;
  if (options.progressive) jpeg_simple_progression(&cinfo);
  cinfo.arith_code = options.arithmetic;
  if (!options.scans.empty()) {
    cinfo.scan_info = options.scans.data();
    cinfo.num_scans = static_cast<int>(options.scans.size());
  }
  jpeg_start_compress(&cinfo, TRUE);
  std::vector<JSAMPLE> row(static_cast<std::size_t>(width * cinfo.input_components));
  while (cinfo.next_scanline < cinfo.image_height) {
    const int y = static_cast<int>(cinfo.next_scanline);
    for (int x = 0; x < width; ++x) {
      for (int c = 0; c < cinfo.input_components; ++c) {
        row[static_cast<std::size_t>(x * cinfo.input_components + c)] =
            static_cast<JSAMPLE>(sample(x, y, c));
      }
    }
    JSAMPROW rows[1] = {row.data()};
    jpeg_write_scanlines(&cinfo, rows, 1);
  }
  jpeg_finish_compress(&cinfo);
  std::vector<std::uint8_t> bytes(buffer, buffer + size);
  jpeg_destroy_compress(&cinfo);
  std::free(buffer);
  return bytes;
}

// Four flat quadrants: red, green, blue, white (left to right, top to bottom).
Pixel Quadrant(int x, int y, int width, int height) {
  const bool right = x >= width / 2, bottom = y >= height / 2;
  if (!bottom) return right ? kGreen : kRed;
  return right ? kWhite : kBlue;
}

int RgbQuadrant(int x, int y, int c, int w, int h) {
  const Pixel p = Quadrant(x, y, w, h);
  return c == 0 ? p.r : c == 1 ? p.g : p.b;
}

// Checks the middle of each quadrant, away from the blurred edges.
void ExpectQuadrants(const Bitmap32& picture, int tolerance) {
  const int w = picture.Width(), h = picture.Height();
  for (const auto& [x, y] :
       {std::pair{w / 4, h / 4}, {3 * w / 4, h / 4}, {w / 4, 3 * h / 4}, {3 * w / 4, 3 * h / 4}}) {
    const Pixel want = Quadrant(x, y, w, h), got = picture.At(x, y);
    EXPECT_NEAR(got.r, want.r, tolerance) << x << "," << y;
    EXPECT_NEAR(got.g, want.g, tolerance) << x << "," << y;
    EXPECT_NEAR(got.b, want.b, tolerance) << x << "," << y;
    EXPECT_EQ(got.a, 255);
  }
}

TEST(JpegDecoder, ReadsBaselineAndProgressiveFiles) {
  constexpr int w = 64, h = 48;
  const auto rgb = [](int x, int y, int c) { return RgbQuadrant(x, y, c, w, h); };
  // Progressive files are sized with their coefficient buffer; the other samplings, restart
  // intervals and stored colour spaces are libjpeg's own business.
  const JpegOptions kinds[] = {
      {}, {.progressive = true}, {.progressive = true, .lumaH = 1, .lumaV = 2, .restartRows = 2}};
  for (const JpegOptions& options : kinds) {
    const Bitmap32 picture = DecodeJpeg(WriteJpeg(w, h, options, rgb));
    ASSERT_EQ(picture.Width(), w);
    ASSERT_EQ(picture.Height(), h);
    ExpectQuadrants(picture, 6);
  }
}

TEST(JpegDecoder, GrayscaleGivesEqualChannels) {
  const Bitmap32 picture =
      DecodeJpeg(WriteJpeg(64, 8, {.input = JCS_GRAYSCALE, .stored = JCS_GRAYSCALE},
                           [](int x, int, int) { return x * 4; }));
  for (int x = 0; x < 64; ++x) {
    const Pixel p = picture.At(x, 3);
    EXPECT_EQ(p, (Pixel{p.r, p.r, p.r, 255})) << x;
    EXPECT_NEAR(p.r, x * 4, 3);
  }
}

// Adobe's CMYK files store inverted inks (255 = no ink); they must not come out as a negative.
TEST(JpegDecoder, AdobeCmykAndYcckGiveTrueColours) {
  constexpr int w = 32, h = 32;
  const auto inks = [](int x, int y, int c) {
    const Pixel p = Quadrant(x, y, w, h);
    // Plain inks for the quadrant colour with no black, stored inverted.
    const int ink[4] = {255 - p.r, 255 - p.g, 255 - p.b, 0};
    return 255 - ink[c];
  };
  for (J_COLOR_SPACE stored : {JCS_CMYK, JCS_YCCK}) {
    const std::vector<std::uint8_t> file =
        WriteJpeg(w, h, {.input = JCS_CMYK, .stored = stored, .lumaH = 1, .lumaV = 1}, inks);
    ExpectQuadrants(DecodeJpeg(file), 8);
  }
  // Black ink alone darkens every colour.
  const auto halfBlack = [](int, int, int c) { return c == 3 ? 255 - 128 : 255; };
  const Pixel gray =
      DecodeJpeg(WriteJpeg(16, 16, {.input = JCS_CMYK, .stored = JCS_CMYK, .lumaH = 1, .lumaV = 1},
                           halfBlack))
          .At(8, 8);
  EXPECT_NEAR(gray.r, 127, 3);
  EXPECT_NEAR(gray.g, 127, 3);
  EXPECT_NEAR(gray.b, 127, 3);
}

// Finds the start-of-frame segment and rewrites the size it declares.
std::vector<std::uint8_t> WithFrameSize(std::vector<std::uint8_t> file, unsigned width,
                                        unsigned height) {
  for (std::size_t i = 2; i + 9 < file.size(); ++i) {
    if (file[i] == 0xFF && (file[i + 1] == 0xC0 || file[i + 1] == 0xC2 || file[i + 1] == 0xC9 ||
                            file[i + 1] == 0xCA)) {
      file[i + 5] = static_cast<std::uint8_t>(height >> 8);
      file[i + 6] = static_cast<std::uint8_t>(height);
      file[i + 7] = static_cast<std::uint8_t>(width >> 8);
      file[i + 8] = static_cast<std::uint8_t>(width);
      return file;
    }
  }
  ADD_FAILURE() << "no frame header";
  return file;
}

// Beyond the limit, empty, cut short, not a JPEG, or (once taking gigabytes and half a minute, or
// filled with gray) announcing far more than the file holds, or a scan broken off by a marker.
TEST(JpegDecoder, RefusesHugeEmptyShortAndBrokenFiles) {
  const auto rgb = [](int x, int y, int c) { return (x * 7 + y * 3 + c * 50) & 255; };
  const std::vector<std::uint8_t> file = WriteJpeg(64, 64, {}, rgb);
  std::vector<std::uint8_t> broken(file.begin(), file.begin() + file.size() / 2);
  broken.insert(broken.end(), {0xFF, 0xD9});
  const std::pair<std::vector<std::uint8_t>, const char*> cases[] = {
      {WithFrameSize(file, 65000, 65000), "65000 by 65000"},
      {WithFrameSize(file, 0, 16), "Empty JPEG image"},
      {WithFrameSize(file, 16, 0), "Empty JPEG image"},
      {WithFrameSize(file, 6000, 6000), "cannot hold a picture of 6000 by 6000"},
      {WithFrameSize(WriteJpeg(64, 64, {.progressive = true}, rgb), 6000, 6000), "cannot hold"},
      {broken, "damaged (corrupt data)"},
      {{}, "empty"},
      {{file.begin(), file.begin() + 2}, "truncated"},
      {{file.begin(), file.begin() + 100}, "truncated"},
      {{file.begin(), file.end() - 40}, "truncated"},
      {{0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A, 0, 0}, "Not a JPEG file"}};
  for (const auto& [bytes, reason] : cases) {
    const std::string error = ErrorOf([&] { DecodeJpeg(bytes); });
    EXPECT_TRUE(Contains(error, reason)) << reason << ": " << error;
  }
  // A file missing only its end marker, or with stray bytes before it, holds the whole picture.
  EXPECT_EQ(DecodeJpeg({file.begin(), file.end() - 2}).Width(), 64);
  std::vector<std::uint8_t> stray(file.begin(), file.end() - 2);
  stray.insert(stray.end(), {0, 0, 0, 0xFF, 0xD9});
  EXPECT_EQ(DecodeJpeg(stray).Width(), 64);
  // The limit is the one given: 64 x 64 is refused at 4095 pixels, read at 4096.
  EXPECT_THROW(DecodeJpeg(file, 4095), PictureFileError);
  EXPECT_EQ(DecodeJpeg(file, 4096).Width(), 64);
}

// The file with a segment of marker and size bytes of zeros after its start-of-image marker.
std::vector<std::uint8_t> WithSegment(std::vector<std::uint8_t> file, std::uint8_t marker,
                                      std::size_t size) {
  std::vector<std::uint8_t> segment = {0xFF, marker, static_cast<std::uint8_t>((size + 2) >> 8),
                                       static_cast<std::uint8_t>(size + 2)};
  segment.resize(4 + size, 0);
  file.insert(file.begin() + 2, segment.begin(), segment.end());
  return file;
}

// Arithmetic coding can hold a flat block in a sliver of a bit, so the one-bit-a-block rule of
// Huffman coding never applied to it, and a 139-byte file opened as 16000 x 16000 pixels; a
// progressive file of hundreds of scans took minutes. Each is refused before anything large is
// allocated; real arithmetic and progressive files still open.
class JpegEvidence : public TempFolder {};

TEST_F(JpegEvidence, ArithmeticAndManyScannedFilesMustHoldTheirPicture) {
  const auto flat = [](int, int, int c) { return 60 * c + 20; };
  const auto rgb = [](int x, int y, int c) { return (x * 7 + y * 3 + c * 50) & 255; };
  // Every coefficient its own scan, for each of three components: 190 scans, 64 visits a block.
  std::vector<jpeg_scan_info> manyScans = {{3, {0, 1, 2, 0}, 0, 0, 0, 0}};
  for (int c = 0; c < 3; ++c)
    for (int k = 1; k < 64; ++k) manyScans.push_back({1, {c, 0, 0, 0}, k, k, 0, 0});
  const JpegOptions arithmetic{.arithmetic = true};
  const JpegOptions progressiveArithmetic{.progressive = true, .arithmetic = true};
  const std::vector<std::uint8_t> arithmeticFile = WriteJpeg(64, 64, arithmetic, rgb);
  const std::pair<std::vector<std::uint8_t>, const char*> cases[] = {
      {WithFrameSize(WriteJpeg(16, 16, arithmetic, flat), 16000, 16000), "cannot hold"},
      // Metadata is no picture data: a large profile or thumbnail makes no difference.
      {WithSegment(WithFrameSize(WriteJpeg(16, 16, arithmetic, flat), 16000, 16000), 0xE2, 60'000),
       "cannot hold"},
      {WithSegment(WithFrameSize(WriteJpeg(16, 16, {}, flat), 4000, 4000), 0xE1, 60'000),
       "cannot hold"},
      {WithFrameSize(WriteJpeg(16, 16, progressiveArithmetic, flat), 16384, 16384), "cannot hold"},
      {WriteJpeg(1024, 1024, {.progressive = true, .arithmetic = true, .scans = manyScans}, flat),
       "190 progressive scans"},
      {WriteJpeg(1024, 1024, {.progressive = true, .scans = manyScans}, flat),
       "190 progressive scans"},
      {{arithmeticFile.begin(), arithmeticFile.end() - 60}, "truncated"},
  };
  for (const auto& [bytes, reason] : cases) {
    WriteBytes(Path("crafted.jpg"), bytes);
    const std::string error = ErrorOf([&] { LoadPictureFile(Path("crafted.jpg")); });
    EXPECT_TRUE(Contains(error, reason)) << reason << " (" << bytes.size() << " bytes): " << error;
  }
  // On a small picture so many scans cost nothing, and the file opens.
  EXPECT_EQ(
      DecodeJpeg(WriteJpeg(256, 256, {.progressive = true, .scans = manyScans}, flat)).Width(),
      256);
  for (const JpegOptions& options : {arithmetic, progressiveArithmetic}) {
    const Bitmap32 picture = DecodeJpeg(WriteJpeg(64, 64, options, rgb));
    EXPECT_EQ(picture.Width(), 64);
    EXPECT_NEAR(picture.At(10, 20).r, rgb(10, 20, 0), 8);
  }
}

// Running out of memory ended the program; now the header is checked against what is left.
TEST(JpegDecoder, PictureBeyondTheAvailableMemorySaysWhatItNeeds) {
  QUILLANE_SKIP_UNDER_ADDRESS_LIMIT();
  auto big = WithFrameSize(WriteJpeg(16, 16, {}, [](int, int, int) { return 9; }), 7000, 7000);
  // As much coded data as a picture of so many blocks needs at least.
  big.insert(big.end() - 2, 100'000, 0);
  EXPECT_EXIT(
      {
        LimitAddressSpaceGrowth(std::uint64_t{300} << 20);
        try {
          DecodeJpeg(big);
        } catch (const PictureFileError& error) {
          std::fputs(error.what(), stderr);
          std::_Exit(1);
        }
        std::_Exit(0);
      },
      ::testing::ExitedWithCode(1), "7000 by 7000 pixels needs 748 MB; [0-9]+ MB are available");
}

TEST(JpegEncoder, WritesBaselineColourQuality90With420Sampling) {
  const Bitmap32 picture = PatternPicture(96, 64);
  const std::vector<std::uint8_t> file = codecs::EncodeJpeg(picture, 90);
  jpeg_decompress_struct cinfo{};
  jpeg_error_mgr err{};
  cinfo.err = jpeg_std_error(&err);
  jpeg_create_decompress(&cinfo);
  jpeg_mem_src(&cinfo, file.data(), file.size());
  jpeg_read_header(&cinfo, TRUE);
  EXPECT_FALSE(cinfo.progressive_mode);
  EXPECT_EQ(cinfo.jpeg_color_space, JCS_YCbCr);
  EXPECT_EQ(cinfo.num_components, 3);
  EXPECT_EQ(cinfo.comp_info[0].h_samp_factor, 2);
  EXPECT_EQ(cinfo.comp_info[0].v_samp_factor, 2);
  // The quality-90 luminance table starts with Round(16 * 20 / 100) = 3.
  ASSERT_NE(cinfo.quant_tbl_ptrs[0], nullptr);
  EXPECT_EQ(cinfo.quant_tbl_ptrs[0]->quantval[0], 3);
  jpeg_destroy_decompress(&cinfo);
  // A baseline frame marker (SOF0), not an extended or arithmetic one.
  const std::uint8_t sof0[] = {0xFF, 0xC0};
  EXPECT_NE(std::search(file.begin(), file.end(), sof0, sof0 + 2), file.end());
}

}  // namespace
}  // namespace quillane::testing
