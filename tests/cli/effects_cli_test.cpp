// Every effect from quillane-cli: the same bytes as its routine run here.
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>

#include "codecs/picture_file.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "effects/registry.h"
#include "effects/surface/emboss.h"
#include "effects/surface/stria.h"

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

using Expected = std::function<TBitmap32(const TBitmap32&)>;

// The effect's table routine with these parameters set over its defaults.
Expected Routine(const char* effect, std::vector<std::pair<const char*, EffectParams::Values>> set,
                 std::uint32_t seed = 0) {
  return [=](const TBitmap32& input) {
    const EffectSpec& spec = *FindEffectByCliName(effect);
    EffectParams params = spec.Defaults();
    for (const auto& [name, value] : set) params.SetList(name, value);
    std::uint32_t s = seed;
    return spec.routine({input, input, params, &s});
  };
}

TEST(EffectsCli, EveryEffectWritesWhatItsRoutineGivesAndBadValuesExitWithTwo) {
  const std::pair<std::string, Expected> cases[] = {
      {"color-pencil --pressure 60", Routine("color-pencil", {{"pressure", {60}}})},
      {"realism --kernel=0,1,0,1,-3,1,0,1,0",
       Routine("realism", {{"kernel", {0, 1, 0, 1, -3, 1, 0, 1, 0}}})},
      {"abstract --kernel 1,1,1,0,2,0,-1,-1,-1",
       Routine("abstract", {{"kernel", {1, 1, 1, 0, 2, 0, -1, -1, -1}}})},
      {"pop-art --kernel -2147483648,0,0,0,0,0,0,0,2147483647",
       Routine("pop-art", {{"kernel", {-2147483648ll, 0, 0, 0, 0, 0, 0, 0, 2147483647}}})},
      {"water-color --scope 2", Routine("water-color", {{"scope", {2}}})},
      {"brume --scope 7", Routine("brume", {{"scope", {7}}})},
      {"brume --seed 4000000000", Routine("brume", {}, 4000000000u)},
      {"texture --texture 15 --pressure 100",
       Routine("texture", {{"texture", {15}}, {"pressure", {100}}})},
      // Against the functions themselves, so the table's reading of the values counts too.
      {"pen-sketch --pen-pressure 200", [](const TBitmap32& p) { return PenSketch(p, 200); }},
      {"vuzorar --vuzorar-pressure 220 --scope 2 --direction falling",
       [](const TBitmap32& p) { return Vuzorar(p, 220, 2, HatchDirection::Falling); }},
      {"vuzorar --direction 4",
       [](const TBitmap32& p) { return Vuzorar(p, 128, 3, HatchDirection::Horizontal); }},
      {"pen-and-ink --adjust-thread 100 --color-ink 1",
       [](const TBitmap32& p) { return Pen_and_Ink(p, 100, true); }},
      {"emboss --lighting 30 --depth 2", [](const TBitmap32& p) { return emboss(p, 30, 2); }},
      {"color-filter --filter cyan",
       [](const TBitmap32& p) { return filter(p, ColorFilterKind::Cyan); }},
      {"color-variety --more red,cyan,cyan",
       [](const TBitmap32& p) { return VarietyClicks(p, {1, 5, 5}); }},
      {"color-panel --layout catercorner-16",
       [](const TBitmap32& p) { return ColorPanel(p, PanelLayout::Catercorner16); }},
      {"hsl-adjust --hue 40 --saturation 150 --lighting 80",
       [](const TBitmap32& p) { return HslAdjust(p, 40, 150, 80); }},
      {"stria --direction horizontal --thickness 3 --space 4 --transparent 60 --color '#ff8000'",
       [](const TBitmap32& p) {
         return stria(p, 23, 17, StriaDirection::Horizontal, 3, 4, 60, 0x0080FF);
       }},
  };
  for (const auto& [arguments, expected] : cases) {
    SCOPED_TRACE(arguments);
    TBitmap32 output;
    std::string err;
    ASSERT_EQ(Apply(arguments, output, err), 0) << err;
    EXPECT_EQ(output, expected(Input()));
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
