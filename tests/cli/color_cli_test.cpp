// The Color menu's effects from quillane-cli: the same bytes as the routines run here.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <QImage>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "codecs/picture_file.h"
#include "effects/paint/brume.h"
#include "effects/registry.h"

namespace quillane {
namespace {

namespace fs = std::filesystem;

class ColorCli : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string pattern = (fs::temp_directory_path() / "quillane-color-cli-XXXXXX").string();
    ASSERT_NE(mkdtemp(pattern.data()), nullptr);
    dir_ = pattern;
    TBitmap32 input(23, 17);
    for (int y = 0; y < 17; ++y)
      for (int x = 0; x < 23; ++x)
        input.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 11), static_cast<std::uint8_t>(y * 15),
                               static_cast<std::uint8_t>((x * y * 7) & 255), 255};
    SaveBitmap24(input, Path("in.bmp"));
    input_ = input;
  }
  void TearDown() override { fs::remove_all(dir_); }

  std::string Path(const std::string& name) const { return dir_ + "/" + name; }

  // Applies effect with options to in.bmp into out.png; the exit code, stderr in err_.
  int Apply(const std::string& effectAndOptions) {
    const std::string command = std::string("'") + QUILLANE_CLI_PATH + "' apply " +
                                effectAndOptions + " '" + Path("in.bmp") + "' -o '" +
                                Path("out.png") + "' >/dev/null 2>'" + Path("err.txt") + "'";
    const int status = std::system(command.c_str());
    std::ifstream err(Path("err.txt"));
    err_.assign(std::istreambuf_iterator<char>(err), std::istreambuf_iterator<char>());
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  TBitmap32 Output() const {
    const QImage image = QImage(QString::fromStdString(Path("out.png")), "png")
                             .convertToFormat(QImage::Format_ARGB32);
    TBitmap32 p(image.width(), image.height());
    for (int y = 0; y < image.height(); ++y)
      std::copy_n(reinterpret_cast<const Pixel*>(image.constScanLine(y)), image.width(),
                  p.ScanLine(y));
    return p;
  }

  std::string dir_;
  std::string err_;
  TBitmap32 input_;
};

TEST_F(ColorCli, EveryEffectWritesWhatItsRoutineGives) {
  struct Case {
    const char* effect;
    const char* options;
    const char* param;
    EffectParams::Values value;
  };
  const Case cases[] = {
      {"color-pencil", "--pressure 60", "pressure", {60}},
      {"realism", "--kernel=0,1,0,1,-3,1,0,1,0", "kernel", {0, 1, 0, 1, -3, 1, 0, 1, 0}},
      {"abstract", "--kernel 1,1,1,0,2,0,-1,-1,-1", "kernel", {1, 1, 1, 0, 2, 0, -1, -1, -1}},
      {"pop-art",
       "--kernel -2147483648,0,0,0,0,0,0,0,2147483647",
       "kernel",
       {-2147483648ll, 0, 0, 0, 0, 0, 0, 0, 2147483647}},
      {"water-color", "--scope 2", "scope", {2}},
      {"brume", "--scope 7", "scope", {7}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.effect);
    ASSERT_EQ(Apply(std::string(c.effect) + " " + c.options), 0) << err_;
    const EffectSpec& spec = *FindEffectByCliName(c.effect);
    EffectParams params = spec.Defaults();
    params.SetList(c.param, c.value);
    std::uint32_t seed = 0;
    EXPECT_EQ(Output(), spec.routine({input_, input_, params, &seed}));
  }
}

TEST_F(ColorCli, SeedReproducesABrumeRunAndBadValuesAreRefused) {
  ASSERT_EQ(Apply("brume --seed 4000000000"), 0) << err_;
  std::uint32_t seed = 4000000000u;
  EXPECT_EQ(Output(), Brume(input_, 3, seed));

  EXPECT_EQ(Apply("realism --kernel 1,2,1,0,abc,0,-1,-1,-1"), 2);
  EXPECT_NE(err_.find("'abc' is not a valid integer value"), std::string::npos) << err_;
  EXPECT_EQ(Apply("pop-art --kernel 1,2,3"), 2);
  EXPECT_EQ(Apply("brume --seed -1"), 2);
  EXPECT_EQ(Apply("brume --seed 4294967296"), 2);
  EXPECT_NE(err_.find("--seed must be an integer from 0 to 4294967295"), std::string::npos) << err_;
}

}  // namespace
}  // namespace quillane
