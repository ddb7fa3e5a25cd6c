// quillane-cli rotate, resize and convert, run as built on real files and checked against the
// routines run here.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include "codecs/picture_file.h"
#include "document/reshape.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

class PictureCommands : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string pattern = (fs::temp_directory_path() / "quillane-cli-XXXXXX").string();
    ASSERT_NE(mkdtemp(pattern.data()), nullptr);
    dir_ = pattern;
    // A 24-bit bitmap with a different colour in every pixel.
    TBitmap32 p(521, 346);
    for (int y = 0; y < p.Height(); ++y)
      for (int x = 0; x < p.Width(); ++x)
        p.At(x, y) = Pixel{static_cast<std::uint8_t>(x), static_cast<std::uint8_t>(y),
                           static_cast<std::uint8_t>(x * y), 0};
    SaveBitmap24(p, Path("in.bmp"));
    SaveBitmap24(TBitmap32(2, 1, Pixel{1, 2, 3, 255}), Path("thin.bmp"));
    opened_ = *LoadPictureFile(Path("in.bmp"));
    SetAlphaChannel(opened_, 255);
  }
  void TearDown() override { fs::remove_all(dir_); }

  std::string Path(const std::string& name) const { return dir_ + "/" + name; }

  // Runs quillane-cli with arguments, names in the test's folder; its exit code, with err_
  // holding what it printed there.
  int Run(const std::string& arguments, const std::string& shellPrefix = "") {
    const std::string command = shellPrefix + "cd '" + dir_ + "' && '" + QUILLANE_CLI_PATH + "' " +
                                arguments + " >stdout.txt 2>stderr.txt";
    const int status = std::system(command.c_str());
    err_ = ReadText(Path("stderr.txt"));
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  std::string dir_;
  std::string err_;
  TBitmap32 opened_;
};

TEST_F(PictureCommands, WriteWhatTheProgramMakes) {
  const auto turned = [&](QuarterTurn turn) { return *RotatePicture(opened_, 260, 173, turn); };
  TBitmap32 resized = opened_;
  const SizeFactors f = ImageSizeFactors(400, 266, 521, 346);
  ZoomInandOut(resized, f.height, f.width);
  struct Case {
    std::string arguments;
    TBitmap32 expected;
  };
  const Case cases[] = {
      {"rotate cw in.bmp -o out.png", turned(QuarterTurn::Clockwise)},
      {"rotate ccw in.bmp -o out.png", turned(QuarterTurn::Anticlockwise)},
      {"resize 400 266 in.bmp -o out.png", resized},
      {"convert in.bmp -o out.png", opened_},
  };
  for (const Case& c : cases) {
    ASSERT_EQ(Run(c.arguments), 0) << c.arguments << ": " << err_;
    EXPECT_TRUE(LoadPng(Path("out.png")) == c.expected) << c.arguments;
  }
  EXPECT_EQ(resized.Width(), 399);
  EXPECT_EQ(turned(QuarterTurn::Clockwise).Width(), 345);

  // The output's extension chooses the type.
  ASSERT_EQ(Run("convert in.bmp -o out.jpg"), 0) << err_;
  EXPECT_EQ(ReadText(Path("out.jpg")).substr(0, 3), "\xFF\xD8\xFF");
  ASSERT_EQ(Run("rotate cw in.bmp -o out.bmp"), 0) << err_;
  const std::optional<TBitmap32> bmp = LoadPictureFile(Path("out.bmp"));
  ASSERT_TRUE(bmp);
  EXPECT_EQ(bmp->Width(), 345);
  EXPECT_EQ(bmp->Height(), 520);
}

TEST_F(PictureCommands, RefusalsSayWhyAndLeaveTheOutputAlone) {
  struct Case {
    std::string arguments;
    int exitCode;
    std::string message;
  };
  const Case cases[] = {
      {"rotate cw thin.bmp -o out.png", 1, "thin.bmp (2 by 1 pixels) is too small to turn"},
      {"resize 1 346 in.bmp -o out.png", 2, "would make the 521 by 346 picture 0 by 346 pixels"},
      {"resize 0 346 in.bmp -o out.png", 2, "whole numbers of pixels from 1 to 2147483647"},
      {"resize 400 2147483648 in.bmp -o out.png", 2, "not '2147483648'"},
      {"resize 30000 20000 in.bmp -o out.png", 2, "larger than the 268435456 pixels"},
      {"rotate left in.bmp -o out.png", 2, "cw (clockwise) or ccw (anticlockwise)"},
      {"convert in.bmp -o out.txt", 2, "cannot tell the output type"},
      {"convert missing.bmp -o out.png", 1, "missing.bmp: no such file"},
  };
  std::ofstream(Path("out.png")) << "kept";
  for (const Case& c : cases) {
    EXPECT_EQ(Run(c.arguments), c.exitCode) << c.arguments;
    EXPECT_NE(err_.find(c.message), std::string::npos) << c.arguments << ": " << err_;
    EXPECT_EQ(ReadText(Path("out.png")), "kept") << c.arguments;
  }
}

TEST_F(PictureCommands, AResizeBeyondTheMemoryLeftIsRefusedBeforeAllocating) {
#if defined(__SANITIZE_ADDRESS__)
  GTEST_SKIP() << "no address-space limit under ASan";
#endif
  EXPECT_EQ(Run("resize 16000 16000 in.bmp -o big.png", "ulimit -v 3000000 && "), 1);
  EXPECT_NE(err_.find("The resized picture of 15999 by 16000 pixels needs"), std::string::npos)
      << err_;
  EXPECT_FALSE(fs::exists(Path("big.png")));
}

}  // namespace
}  // namespace quillane
