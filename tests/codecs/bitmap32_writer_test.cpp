// The 32-bit bitmap file the wallpaper is written as.
#include "codecs/picture_file.h"
#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using Bitmap32Writer = TempFolder;

TEST_F(Bitmap32Writer, WritesEveryByteOfEachPixelBottomRowFirst) {
  Bitmap32 picture(3, 2);
  picture.At(0, 0) = Pixel{1, 2, 3, 4};
  picture.At(2, 0) = Pixel{5, 6, 7, 8};
  picture.At(1, 1) = Pixel{9, 10, 11, 255};
  SaveBitmap32(picture, Path("w.bmp"));
  // Rows of B, G, R, A, the bottom row first.
  const std::vector<std::uint8_t> expected =
      BmpFile(BmpInfoHeader(40, 3, 2, 32, 0, 24), {},
              {0, 0, 0, 0, 9, 10, 11, 255, 0, 0, 0, 0, 1, 2, 3, 4, 0, 0, 0, 0, 5, 6, 7, 8});
  EXPECT_EQ(ReadBytes(Path("w.bmp")), expected);
  EXPECT_TRUE(SameColours(*LoadPictureFile(Path("w.bmp")), picture));

  // Nothing to write is refused, and the file already there stays as it was.
  EXPECT_THROW(SaveBitmap32(Bitmap32(), Path("w.bmp")), PictureFileError);
  EXPECT_EQ(ReadBytes(Path("w.bmp")), expected);
}

}  // namespace
}  // namespace quillane::testing
