// Every effect from quillane-cli: the same bytes as its routine run here.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <iterator>

#include "codecs/picture_file.h"
#include "effects/registry.h"

namespace quillane {
namespace {

TBitmap32 Input() {
  TBitmap32 input(23, 17);
  for (int y = 0; y < 17; ++y)
    for (int x = 0; x < 23; ++x)
      input.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 11), static_cast<std::uint8_t>(y * 15),
                             static_cast<std::uint8_t>((x * y * 7) & 255), 255};
  return input;
}

// Runs "quillane-cli apply" with arguments on Input() into a bitmap file; the exit code, with
// the picture written in output and what went to stderr in err.
int Apply(const std::string& arguments, TBitmap32& output, std::string& err) {
  const std::string dir = testing::TempDir() + "/effects-cli-" + std::to_string(getpid());
  std::filesystem::create_directories(dir);
  SaveBitmap24(Input(), dir + "/in.bmp");
  std::filesystem::remove(dir + "/out.bmp");
  const int status =
      std::system((std::string("'") + QUILLANE_CLI_PATH + "' apply " + arguments + " '" + dir +
                   "/in.bmp' -o '" + dir + "/out.bmp' >/dev/null 2>'" + dir + "/err.txt'")
                      .c_str());
  std::ifstream in(dir + "/err.txt");
  err.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  if (std::filesystem::exists(dir + "/out.bmp")) {
    output = *LoadPictureFile(dir + "/out.bmp");
    SetAlphaChannel(output, 255);
  }
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(EffectsCli, EveryEffectWritesWhatItsRoutineGivesAndBadValuesExitWithTwo) {
  struct Case {
    std::string arguments;
    std::vector<std::pair<const char*, EffectParams::Values>> set;
    std::uint32_t seed;
  };
  const Case cases[] = {
      {"pen-sketch --pen-pressure 200", {{"pen-pressure", {200}}}, 0},
      {"vuzorar --vuzorar-pressure 220 --scope 2 --direction falling",
       {{"vuzorar-pressure", {220}}, {"scope", {2}}, {"direction", {2}}},
       0},
      {"vuzorar --direction 4", {{"direction", {4}}}, 0},
      {"pen-and-ink --adjust-thread 100 --color-ink 1",
       {{"adjust-thread", {100}}, {"color-ink", {1}}},
       0},
      {"color-pencil --pressure 60", {{"pressure", {60}}}, 0},
      {"realism --kernel=0,1,0,1,-3,1,0,1,0", {{"kernel", {0, 1, 0, 1, -3, 1, 0, 1, 0}}}, 0},
      {"abstract --kernel 1,1,1,0,2,0,-1,-1,-1", {{"kernel", {1, 1, 1, 0, 2, 0, -1, -1, -1}}}, 0},
      {"pop-art --kernel -2147483648,0,0,0,0,0,0,0,2147483647",
       {{"kernel", {-2147483648ll, 0, 0, 0, 0, 0, 0, 0, 2147483647}}},
       0},
      {"water-color --scope 2", {{"scope", {2}}}, 0},
      {"brume --scope 7", {{"scope", {7}}}, 0},
      {"brume --seed 4000000000", {}, 4000000000u},
      {"texture --texture 15 --pressure 100", {{"texture", {15}}, {"pressure", {100}}}, 0},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.arguments);
    TBitmap32 output;
    std::string err;
    ASSERT_EQ(Apply(c.arguments, output, err), 0) << err;
    const TBitmap32 input = Input();
    const EffectSpec& spec = *FindEffectByCliName(c.arguments.substr(0, c.arguments.find(' ')));
    EffectParams params = spec.Defaults();
    for (const auto& [name, value] : c.set) params.SetList(name, value);
    std::uint32_t seed = c.seed;
    EXPECT_EQ(output, spec.routine({input, input, params, &seed}));
  }
  TBitmap32 unused;
  std::string err;
  EXPECT_EQ(Apply("realism --kernel 1,2,1,0,abc,0,-1,-1,-1", unused, err), 2);
  EXPECT_NE(err.find("'abc' is not a valid integer value"), std::string::npos) << err;
  EXPECT_EQ(Apply("pop-art --kernel 1,2,3", unused, err), 2);
  EXPECT_EQ(Apply("brume --seed -1", unused, err), 2);
  EXPECT_EQ(Apply("brume --seed 4294967296", unused, err), 2);
  EXPECT_NE(err.find("--seed must be an integer from 0 to 4294967295"), std::string::npos) << err;
}

}  // namespace
}  // namespace quillane
