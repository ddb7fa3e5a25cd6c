// Photos tagged with an EXIF orientation open upright; damaged EXIF blocks cost nothing.
#include <utility>

#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodeJpeg;
using codecs::EncodeJpeg;

// An APP1 segment holding a TIFF block whose first directory has the given entries (tag,
// type, count, value or offset), in the byte order named ("II" or "MM").
struct Entry {
  unsigned tag, type;
  std::uint32_t count, value;
};
std::vector<std::uint8_t> ExifSegment(const std::vector<Entry>& entries, bool bigEndian = false,
                                      std::uint32_t ifdOffset = 8) {
  ByteWriter tiff;
  auto u16 = [&](unsigned v) {
    if (bigEndian)
      tiff.U8(v >> 8).U8(v & 0xFF);
    else
      tiff.U16(v);
  };
  auto u32 = [&](std::uint32_t v) {
    if (bigEndian) {
      u16(v >> 16);
      u16(v & 0xFFFF);
    } else
      tiff.U32(v);
  };
  tiff.Text(bigEndian ? "MM" : "II");
  u16(42);
  u32(ifdOffset);
  u16(static_cast<unsigned>(entries.size()));
  for (const Entry& e : entries) {
    u16(e.tag);
    u16(e.type);
    u32(e.count);
    if (e.type == 3 && e.count == 1) {
      u16(e.value);  // a short sits in the first two bytes of the value field
      u16(0);
    } else {
      u32(e.value);
    }
  }
  u32(0);
  ByteWriter segment;
  segment.U8(0xFF).U8(0xE1);
  const std::size_t length = 2 + 6 + tiff.Size();
  segment.U8(length >> 8).U8(length & 0xFF).Text(std::string("Exif\0\0", 6)).Append(tiff.bytes);
  return segment.bytes;
}

std::vector<std::uint8_t> Orientation(unsigned value, bool bigEndian = false) {
  return ExifSegment({{0x0112, 3, 1, value}}, bigEndian);
}

// The JPEG file with segments put straight after its start marker.
std::vector<std::uint8_t> WithSegments(std::vector<std::uint8_t> jpeg,
                                       const std::vector<std::vector<std::uint8_t>>& segments) {
  for (auto it = segments.rbegin(); it != segments.rend(); ++it)
    jpeg.insert(jpeg.begin() + 2, it->begin(), it->end());
  return jpeg;
}

// Flat gray 8 by 8 blocks on the JPEG block grid, each a level of its own: every block decodes
// to the same pixels wherever it lies and whichever way the picture is stored, so the stored
// forms of one scene decode to exactly that scene's pixels.
Bitmap32 Blocks(int blocksAcross, int blocksDown) {
  Bitmap32 picture(8 * blocksAcross, 8 * blocksDown);
  for (int y = 0; y < picture.Height(); ++y)
    for (int x = 0; x < picture.Width(); ++x) {
      const auto level = static_cast<std::uint8_t>(20 + 11 * ((x / 8) + blocksAcross * (y / 8)));
      picture.At(x, y) = Pixel{level, level, level, 255};
    }
  return picture;
}

// How a camera stores the upright scene under each tag: row 0 and column 0 of the stored
// pixels show the sides of the scene the tag names.
Bitmap32 StoredAs(const Bitmap32& scene, int orientation) {
  const int w = scene.Width(), h = scene.Height();
  const bool swaps = orientation >= 5;
  Bitmap32 stored(swaps ? h : w, swaps ? w : h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const std::pair<int, int> at[9] = {
          {x, y}, {x, y},         {w - 1 - x, y},         {w - 1 - x, h - 1 - y}, {x, h - 1 - y},
          {y, x}, {y, w - 1 - x}, {h - 1 - y, w - 1 - x}, {h - 1 - y, x}};
      stored.At(at[orientation].first, at[orientation].second) = scene.At(x, y);
    }
  return stored;
}

TEST(JpegOrientation, AllEightTagsGiveTheSameUprightPixels) {
  const Bitmap32 scene = Blocks(5, 3);
  const Bitmap32 untagged = DecodeJpeg(EncodeJpeg(scene, 90));
  ASSERT_EQ(untagged.Width(), 40);
  for (int orientation = 1; orientation <= 8; ++orientation) {
    const std::vector<std::uint8_t> stored = EncodeJpeg(StoredAs(scene, orientation), 90);
    for (bool bigEndian : {false, true}) {
      EXPECT_EQ(DecodeJpeg(WithSegments(stored, {Orientation(orientation, bigEndian)})), untagged)
          << "orientation " << orientation << (bigEndian ? " big-endian" : "");
    }
  }
}

// A photo as phones store a portrait shot, opened through the one loader every part uses;
// saved again, it carries no tag that would turn it a second time.
TEST_F(TempFolder, PortraitPhotoOpensUprightAndIsSavedUpright) {
  const Bitmap32 stored = PatternPicture(451, 300);
  const std::vector<std::uint8_t> plain = EncodeJpeg(stored, 90);
  WriteBytes(Path("portrait.JPG"), WithSegments(plain, {Orientation(6)}));
  WriteBytes(Path("plain.jpeg"), WithSegments(plain, {Orientation(1)}));
  const Bitmap32 upright = *LoadPictureFile(Path("portrait.JPG"));
  EXPECT_EQ(upright.Width(), 300);
  EXPECT_EQ(upright.Height(), 451);
  // Tag 1 changes nothing.
  EXPECT_EQ(*LoadPictureFile(Path("plain.jpeg")), DecodeJpeg(plain));
  SaveJpeg(upright, Path("saved.jpg"));
  EXPECT_EQ(LoadPictureFile(Path("saved.jpg"))->Width(), 300);
}

// Broken, lying or foreign blocks are passed over: the picture opens as stored.
TEST(JpegOrientation, UnusableExifBlocksLeaveThePictureAsStored) {
  const std::vector<std::uint8_t> plain = EncodeJpeg(PatternPicture(24, 16), 90);
  const Bitmap32 asStored = DecodeJpeg(plain);
  std::vector<std::uint8_t> cut = Orientation(6);
  cut.resize(14);
  cut[3] = 12;  // the segment's own length agrees with the cut
  std::vector<std::uint8_t> xmp = {0xFF, 0xE1, 0, 8, 'h', 't', 't', 'p', ':', '/'};
  const std::vector<std::vector<std::vector<std::uint8_t>>> cases = {
      {Orientation(0)},
      {Orientation(9)},
      {Orientation(0xFFFF)},
      {ExifSegment({{0x0112, 4, 1, 6}})},                     // a long, not a short
      {ExifSegment({{0x0112, 3, 1, 6}}, false, 0xFFFFFF00)},  // directory far beyond the end
      {ExifSegment({{0x0112, 3, 1000000, 8}})},               // a count with nothing behind it
      {cut},
      {xmp},
  };
  for (std::size_t i = 0; i < cases.size(); ++i) {
    EXPECT_EQ(DecodeJpeg(WithSegments(plain, cases[i])), asStored) << "case " << i;
  }
  // Only the EXIF block counts, not an APP1 segment before it.
  const Bitmap32 turned = DecodeJpeg(WithSegments(plain, {xmp, Orientation(8)}));
  EXPECT_EQ(turned.Width(), 16);
  EXPECT_EQ(turned.At(0, 0), asStored.At(23, 0));
}

}  // namespace
}  // namespace quillane::testing
