// The slider and kernel windows of the Color menu, and the batches of the drawing and painting
// windows.
#include <QPushButton>

#include "tests/gui/window_helpers.h"

namespace quillane {
namespace {

class ColorWindows : public WindowTest {
 protected:
  // What the effect gives on picture with its defaults but one parameter; seed: the random
  // state it starts from, continued.
  Bitmap32 Expected(const EffectSpec& spec, const Bitmap32& picture, const std::string& param,
                    EffectParams::Values value, std::uint32_t& seed) {
    EffectParams params = spec.Defaults();
    params.SetList(param, std::move(value));
    return spec.routine({picture, picture, params, &seed});
  }
};

TEST_F(ColorWindows, SliderWindowsShowTheirNumberAndApplyItOnOk) {
  const struct {
    int tool;
    const char *slider, *number;
    int position;
    const char* shown;
  } cases[] = {{5, "TrackBar1", "Label9", 45, "51"},  // percent of 0..89
               {9, "TrackBar2", "Label3", 5, "5"}};
  std::uint32_t seed = 0;
  for (const auto& c : cases) {
    const EffectSpec& spec = Open(c.tool);
    SCOPED_TRACE(spec.cliName);
    Slide(c.tool, c.slider, c.position - 1);
    Slide(c.tool, c.slider, c.position);
    EXPECT_EQ(Text(c.tool, c.number), c.shown);
    Press(c.tool, "Button1");
    EXPECT_EQ(Working(), Expected(spec, Source(), spec.params[0].name, {c.position}, seed));
  }
}

// The kernel windows share their cells; the refusal is shown on one of them.
TEST_F(ColorWindows, KernelWindowsConvertTheCellsAsTypedAndRefuseWhatIsNoInteger) {
  auto cell = [&](int tool, int i) {
    return Child<QLineEdit>(tool, ("Edit" + std::to_string(i)).c_str());
  };
  std::uint32_t seed = 0;
  for (int tool : {6, 7, 8}) {
    const EffectSpec& spec = Open(tool);
    SCOPED_TRACE(spec.cliName);
    EffectParams::Values typed = spec.params[0].defaultList;
    typed[4] = 3;
    cell(tool, 5)->setText("3");
    Press(tool, "Button1");
    EXPECT_EQ(Working(), Expected(spec, Source(), "kernel", typed, seed));
  }
  // A cell that is no 32-bit integer: the standard error, and nothing changes.
  const Bitmap32 before = Working();
  const int steps = Steps();
  Main().SetStatusText("before");
  for (const char* bad : {"abc", "2147483648"}) {
    cell(8, 2)->setText(bad);
    Press(kPopArt, "Button1");
    EXPECT_EQ(platform_.errors.back(), QString("'%1' is not a valid integer value").arg(bad));
  }
  EXPECT_EQ(Working(), before);
  EXPECT_EQ(Steps(), steps);
  EXPECT_EQ(Main().StatusText(), "before");

  const EffectSpec& spec = *FindEffect(8);
  Press(kPopArt, "Button3");  // Default
  EXPECT_EQ(cell(8, 2)->text(), QString::number(spec.params[0].defaultList[1]));
  EXPECT_EQ(Working(), Expected(spec, Source(), "kernel", spec.params[0].defaultList, seed));
}

TEST_F(ColorWindows, EachBatchWritesItsTagAndRecordsAStepPerPicture) {
  MakeInput({TestPicture(9, 7), TestPicture(12, 5)});
  // A kernel cell that is no integer stops Convert before any picture is loaded.
  Open(kRealism);
  Child<QLineEdit>(kRealism, "Edit4")->setText("x");
  EXPECT_TRUE(Convert(6).empty());
  EXPECT_EQ(platform_.errors, std::vector<QString>{"'x' is not a valid integer value"});
  EXPECT_EQ(Source(), TestPicture());
  Child<QLineEdit>(kRealism, "Edit4")->setText("0");

  for (int tool : {2, 3, 4, 5, 6, 7, 8, 9, 10}) {
    const EffectSpec& spec = Open(tool);
    SCOPED_TRACE(spec.batchTag);
    const int steps = Steps();
    std::uint32_t seed = Main().Document().RandomState();
    Main().SetLineArt(!spec.lineArtAfterApply.value_or(false));
    const std::vector<std::string> written = Convert(tool);
    for (const char* name : {"a", "b"})
      EXPECT_NE(std::find(written.begin(), written.end(), name + ("-" + spec.batchTag) + ".jpg"),
                written.end());
    EXPECT_EQ(Steps(), steps + 2);
    EXPECT_EQ(Main().StatusText(), QString::fromStdString(spec.statusText));
    EXPECT_EQ(Main().LineArt(), spec.lineArtAfterApply.value_or(true));
    // The last picture's result; brume's draws go on from the first picture to the second.
    const std::string& param = spec.params[0].name;
    Expected(spec, Input("a.bmp"), param, DefaultValue(spec.params[0]), seed);
    EXPECT_EQ(Working(), Expected(spec, Input("b.bmp"), param, DefaultValue(spec.params[0]), seed));
    EXPECT_EQ(Main().Document().RandomState(), seed);
  }
  EXPECT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
