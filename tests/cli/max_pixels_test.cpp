// --max-pixels: parsed wherever an option may stand in a command that reads pictures, and the
// limit the program then opens pictures under.
#include <string>
#include <vector>

#include "cli/cli_options.h"
#include "codecs/picture_file.h"
#include "tests/cli/cli_run.h"

namespace quillane {
namespace {

TEST(MaxPixelsOption, IsTakenFromAnyPictureCommandAndCheckedForRange) {
  const struct {
    std::vector<std::string> args;
    std::int64_t maxPixels;  // expected; 0 for the default
    std::string error;       // part of the expected error, or empty
  } cases[] = {
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels", "5000"}, 5000, ""},
      {{"apply", "pencil-sketch", "--max-pixels=268435456", "a.bmp", "-o", "b.png"}, 268435456, ""},
      {{"batch", "emboss", "--max-pixels", "7", "--input", "i", "--output", "o"}, 7, ""},
      {{"convert", "a.bmp", "-o", "b.png"}, 0, ""},
      // After "--" it is a file name like any other.
      {{"convert", "-o", "b.png", "--", "--max-pixels"}, 0, ""},
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels", "0"}, 0, "from 1 to 268435456, not '0'"},
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels=268435457"}, 0, "not '268435457'"},
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels", "1e6"}, 0, "not '1e6'"},
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels"}, 0, "--max-pixels must be"},
      {{"convert", "a.bmp", "-o", "b.png", "--max-pixels=5", "--max-pixels=6"}, 0, "given twice"},
      {{"list", "--max-pixels", "5"}, 0, "list takes no arguments"},
  };
  for (const auto& c : cases) {
    const cli::ParseResult r = cli::ParseCommandLine(c.args);
    const std::string shown = c.args.back();
    if (c.error.empty()) {
      ASSERT_TRUE(r.Ok()) << shown << ": " << r.error;
      EXPECT_EQ(r.options.maxPixels, c.maxPixels) << shown;
    } else {
      EXPECT_EQ(r.exitCode, cli::kExitUsage) << shown;
      EXPECT_NE(r.error.find(c.error), std::string::npos) << shown << ": " << r.error;
    }
  }
}

class MaxPixelsRun : public CliRun {};

TEST_F(MaxPixelsRun, PicturesBeyondTheLimitAreRefusedWithHowToRaiseIt) {
  SaveBitmap24(Bitmap32(521, 346), Path("in.bmp"));
  EXPECT_EQ(Run("convert in.bmp -o out.png --max-pixels 180000"), 1);
  EXPECT_NE(err_.find("521 by 346 pixels, more than the 180000 pixels"), std::string::npos) << err_;
  EXPECT_NE(err_.find("--max-pixels 180266 raises the limit"), std::string::npos) << err_;
  EXPECT_EQ(Run("convert in.bmp -o out.png --max-pixels 180266"), 0) << err_;
  EXPECT_TRUE(LoadPng(Path("out.png")));
  // The default is the one documented in --help.
  EXPECT_NE(cli::UsageText().find(std::to_string(kDefaultMaxPicturePixels) + " pixels"),
            std::string::npos);
}

}  // namespace
}  // namespace quillane
