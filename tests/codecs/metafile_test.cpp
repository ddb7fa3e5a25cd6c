// Windows metafiles (played by libwmf) and enhanced metafiles (our own reader and writer, and
// the renderer program for vector content).
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodeMetafile;

// records behind a placeable header (none for unitsPerInch 0) of w x h units and the
// standard header.
std::vector<std::uint8_t> Wmf(const ByteWriter& records, int w, int h, int unitsPerInch,
                              unsigned objects, std::uint32_t largestRecord) {
  ByteWriter file;
  if (unitsPerInch > 0) {
    file.U32(0x9AC6CDD7).U16(0).I16(0).I16(0).I16(w).I16(h).U16(unitsPerInch).U32(0);
    std::uint16_t checksum = 0;
    for (std::size_t i = 0; i < 20; i += 2) checksum ^= file.bytes[i] | file.bytes[i + 1] << 8;
    file.U16(checksum);
  }
  file.U16(1).U16(9).U16(0x0300).U32(static_cast<std::uint32_t>(9 + records.Size() / 2));
  file.U16(objects).U32(largestRecord).U16(0);
  return file.Append(records.bytes).bytes;
}

// A placeable metafile of 40 x 30 pixels, in units of 1/96 inch or (k = 15) twips: white, a red
// rectangle from (10, 5) to (30, 25) drawn with a null pen, and a blue line along row 2 from
// column 2 to 37.
std::vector<std::uint8_t> WmfWithRectangle(int k = 1) {
  ByteWriter records;
  std::uint32_t largest = 0;
  const auto record = [&](unsigned function, std::vector<int> params) {
    const auto words = static_cast<std::uint32_t>(3 + params.size());
    largest = std::max(largest, words);
    records.U32(words).U16(function);
    for (int p : params) records.I16(p);
  };
  record(0x020B, {0, 0});                           // SetWindowOrg (y, x)
  record(0x020C, {30 * k, 40 * k});                 // SetWindowExt (y, x)
  record(0x02FC, {0, 0x00FF, 0, 0});                // CreateBrushIndirect: solid, red
  record(0x012D, {0});                              // SelectObject
  record(0x02FA, {5, 0, 0, 0, 0});                  // CreatePenIndirect: null pen
  record(0x012D, {1});                              //
  record(0x041B, {25 * k, 30 * k, 5 * k, 10 * k});  // Rectangle (bottom, right, top, left)
  record(0x02FA, {0, k, 0, 0, 0x00FF});             // CreatePenIndirect: solid, blue
  record(0x012D, {2});                              //
  record(0x0214, {2 * k, 2 * k});                   // MoveTo (y, x)
  record(0x0213, {2 * k, 37 * k});                  // LineTo (y, x)
  record(0x0000, {});                               // EOF
  return Wmf(records, 40 * k, 30 * k, 96 * k, 3, largest);
}

// The header's largest-record field sizes the player's buffer: a made-up value must neither
// make it allocate gigabytes nor leave it a buffer too small for the real records.
TEST(WindowsMetafile, PlaysShapesAndLinesOnWhiteWhateverTheLargestRecordField) {
  // claimed 1 keeps the file's own, true value.
  for (const int k : {1, 15})
    for (std::uint32_t claimed : {1u, 0xFFFFFFFFu, 0x6110001Du, 3u, 0u}) {
      std::vector<std::uint8_t> file = WmfWithRectangle(k);
      if (claimed != 1)
        for (int i = 0; i < 4; ++i)
          file[22 + 12 + i] = static_cast<std::uint8_t>(claimed >> (8 * i));
      const Bitmap32 p = DecodeMetafile(file);
      SCOPED_TRACE(::testing::Message() << k << " " << claimed);
      ASSERT_EQ(p.Width(), 40);
      ASSERT_EQ(p.Height(), 30);
      EXPECT_EQ(p.At(20, 15), kRed);
      EXPECT_EQ(p.At(12, 7), kRed);
      EXPECT_EQ(p.At(20, 2), kBlue);
      EXPECT_EQ(p.At(2, 12), kWhite);
      EXPECT_EQ(p.At(36, 27), kWhite);
    }
}

// A metafile that only draws picture as one 24-bit bitmap at its own size, the window in units
// of 1/unitsPerInch inch (1440: twips), with or without the placeable header.
std::vector<std::uint8_t> WmfWithBitmap(const Bitmap32& picture, int unitsPerInch, bool placeable) {
  const int w = picture.Width() * unitsPerInch / 96, h = picture.Height() * unitsPerInch / 96;
  codecs::MemorySink dib;
  codecs::WriteDib24(picture, dib);
  ByteWriter records;
  records.U32(5).U16(0x020B).I16(0).I16(0);  // SetWindowOrg
  records.U32(5).U16(0x020C).I16(h).I16(w);  // SetWindowExt
  const auto words = static_cast<std::uint32_t>(14 + dib.bytes().size() / 2);
  records.U32(words).U16(0x0F43).U32(0x00CC0020).U16(0);  // StretchDIB, SRCCOPY, RGB colours
  for (int v : {picture.Height(), picture.Width(), 0, 0, h, w, 0, 0}) records.I16(v);
  records.Append(dib.bytes()).U32(3).U16(0);  // EOF
  return Wmf(records, w, h, placeable ? unitsPerInch : 0, 0, words);
}

// Such a file loaded as a blown-up top-left corner (placeable) or at 68 x 68 (not placeable).
TEST(WindowsMetafile, BitmapDrawnAtItsOwnSizeGivesExactlyItsPixels) {
  const Bitmap32 picture = PatternPicture(237, 158);
  for (const int unitsPerInch : {96, 1440}) {
    for (const bool placeable : {true, false}) {
      const Bitmap32 p = DecodeMetafile(WmfWithBitmap(picture, unitsPerInch, placeable));
      ASSERT_EQ(p.Width(), 237) << unitsPerInch << placeable;
      ASSERT_EQ(p.Height(), 158) << unitsPerInch << placeable;
      EXPECT_TRUE(SameColours(p, picture)) << unitsPerInch << placeable;
    }
  }
}

TEST(WindowsMetafile, RefusesDamagedAndHugeFiles) {
  const std::vector<std::uint8_t> file = WmfWithRectangle();
  // Cut inside the records: the record walk finds a record running past the end.
  EXPECT_THROW(DecodeMetafile({file.begin(), file.begin() + 60}), PictureFileError);
  EXPECT_THROW(DecodeMetafile({file.begin(), file.begin() + 30}), PictureFileError);
  EXPECT_THROW(
      DecodeMetafile(std::vector<std::uint8_t>{'n', 'o', 't', ' ', 'a', ' ', 'm', 'e', 't', 'a'}),
      PictureFileError);
  // 32767 units at 1 unit an inch is 3 million pixels a side.
  std::vector<std::uint8_t> huge = file;
  std::copy_n("\xFF\x7F\xFF\x7F\x01\x00", 6, huge.begin() + 10);
  EXPECT_THROW(DecodeMetafile(huge), PictureFileError);
}

std::string DecodeError(const std::vector<std::uint8_t>& file) {
  return ErrorOf([&] { DecodeMetafile(file, 1 << 22); });
}

// Found by fuzzing: a pen 3841 units wide on a 40 x 30 window kept libwmf drawing for minutes
// inside a single record, out of reach of any check between records.
ByteWriter EndlessWmf() {
  ByteWriter file;
  file.U32(0x9AC6CDD7).U16(0).I16(-2304).I16(-1).I16(215).I16(30).U16(96).U32(0).U16(0x5747);
  file.U16(1).U16(9).U16(0x0300).U32(0x3B).U16(2).U32(6).U16(0);
  file.U32(5).U16(0x020C).I16(30).I16(40);                     // SetWindowExt
  file.U32(7).U16(0x02FC).U16(0).U32(0x00FF).U16(0);           // CreateBrushIndirect
  file.U32(4).U16(0x017A).U16(0);                              // SetPolyFillMode
  file.U32(8).U16(0x02FA).U16(0).U32(0x0F01).U32(0x0F00);      // CreatePenIndirect, width 3841
  file.U32(4).U16(0x012D).U16(1);                              // SelectObject
  file.U32(7).U16(0x041B).I16(25).I16(30).I16(5).I16(10);      // Rectangle
  file.U32(7).U16(0x0418).I16(28).I16(0x5526).I16(2).I16(20);  // Ellipse
  file.U32(3).U16(0);
  return file;
}

TEST(WindowsMetafile, EndlessDrawingIsStoppedAndReported) {
  const ByteWriter file = EndlessWmf();
  ASSERT_EQ(file.Size(), 130u);
  const std::string error = DecodeError(file.bytes);
  EXPECT_TRUE(error == "The metafile takes too long to draw" ||
              error == "The metafile cannot be drawn")
      << error;
  // The renderer was killed and reaped, as after an ordinary picture.
  EXPECT_EQ(DecodeMetafile(WmfWithRectangle()).At(20, 15), kRed);
  errno = 0;
  EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
  EXPECT_EQ(errno, ECHILD);
}

// The renderer processes whose parent is pid.
std::vector<pid_t> RenderersOf(pid_t parent) {
  std::vector<pid_t> found;
  for (const auto& entry : std::filesystem::directory_iterator("/proc")) {
    std::ifstream stat(entry.path() / "stat");
    std::string pid, name, state;
    pid_t ppid = 0;
    if (stat >> pid >> name >> state >> ppid && ppid == parent && Contains(name, "(quillane-") &&
        state != "Z")
      found.push_back(std::stoi(pid));
  }
  return found;
}

bool Running(pid_t pid) {
  std::ifstream stat("/proc/" + std::to_string(pid) + "/stat");
  std::string id, name, state;
  return stat >> id >> name >> state && state != "Z";
}

// A renderer killed with the program once drew on for as long as its CPU limit let it (10 to 17
// seconds); the kernel now ends it with its parent.
TEST(WindowsMetafile, RendererDiesWithTheProgram) {
  const std::vector<std::uint8_t> file = EndlessWmf().bytes;
  const pid_t program = ::fork();
  ASSERT_GE(program, 0);
  if (program == 0) {
    ErrorOf([&] { DecodeMetafile(file, 1 << 22); });
    std::_Exit(0);
  }
  std::vector<pid_t> renderers;
  for (int tries = 0; tries < 500 && renderers.empty(); ++tries) {
    ::usleep(10'000);
    renderers = RenderersOf(program);
  }
  ::kill(program, SIGKILL);
  ::waitpid(program, nullptr, 0);
  ASSERT_EQ(renderers.size(), 1u);
  // Well within the renderer's CPU limit.
  bool gone = false;
  for (int tries = 0; tries < 300 && !gone; ++tries) {
    gone = !Running(renderers[0]);
    if (!gone) ::usleep(10'000);
  }
  EXPECT_TRUE(gone);
}

// An enhanced metafile for a 96 dpi reference device whose frame is width x height pixels,
// with the given records between header and end.
std::vector<std::uint8_t> Emf(int width, int height, const std::vector<std::uint8_t>& records) {
  ByteWriter w;
  w.U32(1).U32(108).I32(0).I32(0).I32(width - 1).I32(height - 1);
  w.I32(0).I32(0).I32(width * 2540 / 96).I32(height * 2540 / 96);
  w.U32(0x464D4520).U32(0x10000).U32(0).U32(0).U16(1).U16(0).U32(0).U32(0).U32(0);
  w.I32(4800).I32(2400).I32(1270).I32(635).U32(0).U32(0).U32(0).I32(1270000).I32(635000);
  w.Append(records);
  w.U32(14).U32(20).U32(0).U32(16).U32(20);
  w.PatchU32(48, static_cast<std::uint32_t>(w.Size()));
  return w.bytes;
}

// A 2 x 2 bottom-up 24-bit bitmap: top row red, green; bottom row blue, white.
std::vector<std::uint8_t> TwoByTwoDib() {
  ByteWriter w;
  w.Append(BmpInfoHeader(40, 2, 2, 24, 0, 16));
  w.U8(255).U8(0).U8(0).U8(255).U8(255).U8(255).U16(0);
  w.U8(0).U8(0).U8(255).U8(0).U8(255).U8(0).U16(0);
  return w.bytes;
}

std::vector<std::uint8_t> StretchDiBits(int x, int y, int cx, int cy) {
  const std::vector<std::uint8_t> dib = TwoByTwoDib();
  ByteWriter w;
  w.U32(81).U32(static_cast<std::uint32_t>(80 + dib.size())).I32(0).I32(0).I32(0).I32(0);
  w.I32(x).I32(y).I32(0).I32(0).I32(2).I32(2).U32(80).U32(40).U32(120).U32(16).U32(0);
  w.U32(0x00CC0020).I32(cx).I32(cy).Append(dib);
  return w.bytes;
}

std::vector<std::uint8_t> BitBlt(int x, int y) {
  const std::vector<std::uint8_t> dib = TwoByTwoDib();
  ByteWriter w;
  w.U32(76).U32(static_cast<std::uint32_t>(100 + dib.size())).I32(0).I32(0).I32(0).I32(0);
  w.I32(x).I32(y).I32(2).I32(2).U32(0x00CC0020).I32(0).I32(0);
  for (float f : {1.f, 0.f, 0.f, 1.f, 0.f, 0.f}) w.F32(f);
  w.U32(0).U32(0).U32(100).U32(40).U32(140).U32(16).Append(dib);
  return w.bytes;
}

void ExpectBlocks(const Bitmap32& p, int x0, int y0, int block) {
  EXPECT_EQ(p.At(x0, y0), kRed);
  EXPECT_EQ(p.At(x0 + block - 1, y0 + block - 1), kRed);
  EXPECT_EQ(p.At(x0 + block, y0), kGreen);
  EXPECT_EQ(p.At(x0, y0 + block), kBlue);
  EXPECT_EQ(p.At(x0 + 2 * block - 1, y0 + 2 * block - 1), kWhite);
}

TEST(EnhancedMetafile, PlaysBitmapRecordsWithTheirPlacement) {
  // Stretched to fill a 4 x 4 frame: each source pixel becomes a 2 x 2 block.
  const Bitmap32 stretched = DecodeMetafile(Emf(4, 4, StretchDiBits(0, 0, 4, 4)));
  ASSERT_EQ(stretched.Width(), 4);
  ASSERT_EQ(stretched.Height(), 4);
  ExpectBlocks(stretched, 0, 0, 2);

  // The same through a world transform that doubles everything.
  ByteWriter transformed;
  transformed.U32(35).U32(32);
  for (float f : {2.f, 0.f, 0.f, 2.f, 0.f, 0.f}) transformed.F32(f);
  transformed.Append(StretchDiBits(0, 0, 2, 2));
  ExpectBlocks(DecodeMetafile(Emf(4, 4, transformed.bytes)), 0, 0, 2);

  // A blit at (3, 1) on a 6 x 4 frame; the rest stays white.
  const Bitmap32 blit = DecodeMetafile(Emf(6, 4, BitBlt(3, 1)));
  ASSERT_EQ(blit.Width(), 6);
  ExpectBlocks(blit, 3, 1, 1);
  EXPECT_EQ(blit.At(0, 0), kWhite);
  EXPECT_EQ(blit.At(5, 3), kWhite);
}

TEST(EnhancedMetafile, RefusesDamagedAndHostileFiles) {
  codecs::MemorySink sink;
  codecs::EncodeEnhancedMetafile(PatternPicture(20, 10), sink);
  const std::vector<std::uint8_t>& file = sink.bytes();
  // Cut inside the bitmap record.
  EXPECT_THROW(DecodeMetafile({file.begin(), file.begin() + 300}), PictureFileError);
  // A frame of 2 x 10^9 hundredths of a millimetre; a bitmap whose offsets point past its
  // record; a bitmap record that claims a width of 10^8.
  const std::pair<std::size_t, std::vector<std::uint8_t>> patches[] = {
      {32, {0, 0x94, 0x35, 0x77, 0, 0x94, 0x35, 0x77}},
      {108 + 56, {0xF0, 0xFF}},
      {108 + 84, {0, 0xE1, 0xF5, 0x05}}};
  for (const auto& [at, bytes] : patches) {
    std::vector<std::uint8_t> damaged = file;
    std::copy(bytes.begin(), bytes.end(), damaged.begin() + static_cast<std::ptrdiff_t>(at));
    EXPECT_THROW(DecodeMetafile(damaged), PictureFileError) << at;
  }
}

// A solid blue brush, the stock null pen, and a polygon filling (10, 5) to (30, 25) on a 40 x 30
// frame: vector drawing, which the renderer program draws.
std::vector<std::uint8_t> EmfWithPolygon() {
  ByteWriter w;
  w.U32(39).U32(24).U32(1).U32(0).U32(0x00FF0000).U32(0);  // CreateBrushIndirect: solid, blue
  w.U32(37).U32(12).U32(1);                                // SelectObject
  w.U32(37).U32(12).U32(0x80000008);                       // SelectObject: NULL_PEN
  w.U32(86).U32(28 + 4 * 4).I32(10).I32(5).I32(30).I32(25).U32(4);  // Polygon16
  w.I16(10).I16(5).I16(30).I16(5).I16(30).I16(25).I16(10).I16(25);
  return Emf(40, 30, w.bytes);
}

TEST(EnhancedMetafile, DrawsVectorContentOnWhite) {
  const Bitmap32 p = DecodeMetafile(EmfWithPolygon());
  ASSERT_EQ(p.Width(), 40);
  ASSERT_EQ(p.Height(), 30);
  // Inside, away from the antialiased edges, and well outside.
  for (const auto& [x, y] : {std::pair{12, 7}, {20, 15}, {28, 23}}) {
    EXPECT_EQ(p.At(x, y), kBlue) << x << "," << y;
  }
  for (const auto& [x, y] : {std::pair{0, 0}, {7, 15}, {33, 15}, {20, 2}, {20, 28}, {39, 29}}) {
    EXPECT_EQ(p.At(x, y), kWhite) << x << "," << y;
  }

  // Bitmaps and shapes in one file: the renderer draws both.
  ByteWriter both;
  both.Append(StretchDiBits(0, 0, 8, 8));
  both.U32(39).U32(24).U32(1).U32(0).U32(0x000000FF).U32(0);
  both.U32(37).U32(12).U32(1).U32(37).U32(12).U32(0x80000008);
  both.U32(43).U32(24).I32(10).I32(5).I32(30).I32(25);  // Rectangle
  const Bitmap32 mixed = DecodeMetafile(Emf(40, 30, both.bytes));
  EXPECT_EQ(mixed.At(1, 1), kRed);
  EXPECT_EQ(mixed.At(6, 1), kGreen);
  EXPECT_EQ(mixed.At(1, 6), kBlue);
  EXPECT_EQ(mixed.At(20, 15), kRed);
  EXPECT_EQ(mixed.At(35, 15), kWhite);
}

// Text needs fonts, which the renderer finds with no display.
TEST(EnhancedMetafile, DrawsText) {
  ByteWriter w;
  w.U32(82).U32(12 + 92).U32(1).I32(-40).I32(0).I32(0).I32(0).I32(400).U32(0).U32(0);
  ByteWriter face;
  for (char c : std::string("DejaVu Sans")) face.U16(static_cast<unsigned char>(c));
  face.bytes.resize(64);
  w.Append(face.bytes);                                // ExtCreateFontIndirectW
  w.U32(37).U32(12).U32(1);                            // SelectObject
  w.U32(84).U32(76 + 12).I32(0).I32(0).I32(0).I32(0);  // ExtTextOutW
  w.U32(1).F32(0).F32(0).I32(10).I32(10).U32(5).U32(76).U32(0);
  w.I32(0).I32(0).I32(0).I32(0).U32(0);
  for (char c : std::string("Hello")) w.U16(static_cast<unsigned char>(c));
  w.U16(0);
  const Bitmap32 p = DecodeMetafile(Emf(200, 60, w.bytes));
  int dark = 0;
  for (int y = 0; y < p.Height(); ++y) {
    for (int x = 0; x < p.Width(); ++x) dark += p.At(x, y).g < 128;
  }
  EXPECT_GT(dark, 200);
  EXPECT_EQ(p.At(190, 5), kWhite);
}

TEST(Metafiles, MissingOrWrongRendererIsReported) {
  for (const auto& [variable, file] : {std::pair{"QUILLANE_WMF_RENDER", WmfWithRectangle()},
                                       {"QUILLANE_EMF_RENDER", EmfWithPolygon()}}) {
    // Not there; silent; sending the file back (no reply it could mean, more bytes than any
    // reply without pixels).
    for (const char* renderer : {"/nonexistent/quillane-render", "/bin/true", "/bin/cat"}) {
      ::setenv(variable, renderer, 1);
      EXPECT_EQ(DecodeError(file), renderer[1] == 'n' ? "The metafile reader is not installed"
                                                      : "The metafile cannot be drawn")
          << variable << " " << renderer;
      // Enhanced metafiles of bitmaps alone are still played here.
      ExpectBlocks(DecodeMetafile(Emf(4, 4, StretchDiBits(0, 0, 4, 4))), 0, 0, 2);
      ::unsetenv(variable);
    }
  }
}

}  // namespace
}  // namespace quillane::testing
