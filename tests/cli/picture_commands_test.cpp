// quillane-cli rotate, resize and convert, run as built on real files and checked against the
// routines run here.
#include <array>
#include <fstream>
#include <string>

#include "codecs/picture_file.h"
#include "document/reshape.h"
#include "tests/cli/cli_run.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

class PictureCommands : public CliRun {
 protected:
  void SetUp() override {
    CliRun::SetUp();
    opened_ = RandomPicture(521, 346, 5);
    SetAlphaChannel(opened_, 255);  // as the program opens the bitmap
    SaveBitmap24(opened_, Path("in.bmp"));
    SaveBitmap24(Bitmap32(2, 1), Path("thin.bmp"));
  }
  std::string Read(const std::string& name) const { return ReadText(Path(name)); }

  Bitmap32 opened_;
};

TEST_F(PictureCommands, WriteWhatTheProgramMakes) {
  const struct {
    std::string arguments;
    Bitmap32 expected;
  } cases[] = {
      {"rotate cw in.bmp -o out.png", *RotatePicture(opened_, 260, 173, QuarterTurn::Clockwise)},
      {"convert in.bmp -o out.png", opened_},
  };
  for (const auto& c : cases) {
    ASSERT_EQ(Run(c.arguments), 0) << c.arguments << ": " << err_;
    EXPECT_TRUE(LoadPng(Path("out.png")) == c.expected) << c.arguments;
  }

  // 400 by 266 is 399 by 266 (the width factor 400 / 521 rounds downward); each pixel is the
  // source pixel its position falls in, worked by hand.
  ASSERT_EQ(Run("resize 400 266 in.bmp -o out.png"), 0) << err_;
  const Bitmap32 resized = *LoadPng(Path("out.png"));
  ASSERT_EQ(resized.Width(), 399);
  ASSERT_EQ(resized.Height(), 266);
  for (auto [x, y, sourceX, sourceY] : {std::array{2, 2, 2, 2}, {3, 1, 3, 1}, {398, 265, 519, 344}})
    EXPECT_EQ(resized.At(x, y), opened_.At(sourceX, sourceY)) << x << ", " << y;
}

TEST_F(PictureCommands, RefusalsSayWhyAndLeaveTheOutputAlone) {
  const struct {
    std::string arguments;
    int exitCode;
    std::string message;
  } cases[] = {
      {"rotate cw thin.bmp -o out.png", 1, "thin.bmp (2 by 1 pixels) is too small to turn"},
      {"resize 1 346 in.bmp -o out.png", 2, "would make the 521 by 346 picture 0 by 346 pixels"},
      {"resize 30000 20000 in.bmp -o out.png", 2, "larger than the 268435456 pixels"},
      {"rotate left in.bmp -o out.png", 2, "cw (clockwise) or ccw (anticlockwise)"},
      {"convert missing.bmp -o out.png", 1, "missing.bmp: no such file"},
  };
  std::ofstream(Path("out.png")) << "kept";
  for (const auto& c : cases) {
    EXPECT_EQ(Run(c.arguments), c.exitCode) << c.arguments;
    EXPECT_NE(err_.find(c.message), std::string::npos) << c.arguments << ": " << err_;
    EXPECT_EQ(Read("out.png"), "kept") << c.arguments;
  }
#if !defined(__SANITIZE_ADDRESS__)  // no address-space limit under ASan
  EXPECT_EQ(Run("resize 16000 16000 in.bmp -o out.png", "ulimit -v 3000000 && "), 1);
  EXPECT_NE(err_.find("The resized picture of 15999 by 16000 pixels needs"), std::string::npos);
#endif
}

}  // namespace
}  // namespace quillane
