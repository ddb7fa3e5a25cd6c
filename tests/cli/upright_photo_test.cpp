// A portrait photo tagged "turn a quarter clockwise" comes out upright from every command.
#include <filesystem>
#include <fstream>

#include "codecs/codec_internal.h"
#include "codecs/picture_file.h"
#include "tests/cli/cli_run.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

// An APP1 EXIF block (little-endian TIFF) holding Orientation = 6 and nothing else.
constexpr unsigned char kTurnClockwise[] = {
    0xFF, 0xE1, 0,    34,   'E', 'x', 'i', 'f', 0, 0, 'I', 'I', 42, 0, 8, 0, 0, 0,
    1,    0,    0x12, 0x01, 3,   0,   1,   0,   0, 0, 6,   0,   0,  0, 0, 0, 0, 0};

TEST_F(CliRun, EveryCommandTurnsATaggedPortraitPhotoUpright) {
  std::vector<std::uint8_t> jpeg = codecs::EncodeJpeg(RandomPicture(45, 30, 3), 90);
  jpeg.insert(jpeg.begin() + 2, std::begin(kTurnClockwise), std::end(kTurnClockwise));
  std::filesystem::create_directory(Path("in"));
  std::ofstream(Path("in/photo.jpg"), std::ios::binary)
      .write(reinterpret_cast<const char*>(jpeg.data()), static_cast<std::streamsize>(jpeg.size()));

  const Bitmap32 upright = *LoadPictureFile(Path("in/photo.jpg"));
  ASSERT_EQ(upright.Width(), 30);
  ASSERT_EQ(Run("convert " + Q("in/photo.jpg") + " -o " + Q("out.bmp")), 0) << err_;
  EXPECT_TRUE(*LoadPictureFile(Path("out.bmp")) == upright);
  ASSERT_EQ(Run("apply pencil-sketch " + Q("in/photo.jpg") + " -o " + Q("sketch.png")), 0) << err_;
  EXPECT_EQ(LoadPng(Path("sketch.png"))->Height(), 45);
  ASSERT_EQ(Run("rotate cw " + Q("in/photo.jpg") + " -o " + Q("turned.bmp")), 0) << err_;
  EXPECT_GE(LoadPictureFile(Path("turned.bmp"))->Width(), 44);
  ASSERT_EQ(Run("batch pencil-sketch --input " + Q("in") + " --output " + Q("out")), 0) << err_;
  EXPECT_EQ(LoadPictureFile(Path("out/photo-PencilSketch.jpg"))->Width(), 30);
}

}  // namespace
}  // namespace quillane
