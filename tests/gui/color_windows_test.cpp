#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QSlider>
#include <QToolButton>

#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

class ColorWindows : public FileGuiTest {
 protected:
  // Opens the window of tool number n from its menu entry.
  const EffectSpec& Open(int n) {
    MenuAction(QString::fromStdString(Tool(n).Spec().menuHandler).chopped(5))->trigger();
    EXPECT_TRUE(Tool(n).isVisible());
    return Tool(n).Spec();
  }
  QString Text(int n, const char* label) { return ToolChild<QLabel>(n, label)->text(); }
  const TBitmap32& Working() { return Main().Document().Working(); }
  int Steps() { return Main().Document().UndoCount(); }
  // What the effect gives on picture with its defaults but one parameter; seed: the random
  // state it starts from, continued.
  TBitmap32 Expected(const EffectSpec& spec, const TBitmap32& picture, const std::string& param,
                     EffectParams::Values value, std::uint32_t& seed) {
    EffectParams params = spec.Defaults();
    params.SetList(param, std::move(value));
    return spec.routine({picture, picture, params, &seed});
  }
};

TEST_F(ColorWindows, SliderWindowsShowTheirNumberAndApplyItOnOk) {
  struct Case {
    int tool;
    const char *slider, *label, *caption, *number, *initial;
    int maximum, position;
    const char* shown;
  };
  const Case cases[] = {
      {5, "TrackBar1", "Label8", "Pressure:", "Label9", "50", 89, 45, "51"},
      {9, "TrackBar2", "Label2", "Scope:", "Label3", "3", 5, 5, "5"},
      {10, "TrackBar2", "Label2", "Scope:", "Label3", "3", 10, 9, "9"},
  };
  std::uint32_t seed = 0;
  for (const Case& c : cases) {
    const EffectSpec& spec = Open(c.tool);
    SCOPED_TRACE(spec.cliName);
    auto* slider = ToolChild<QSlider>(c.tool, c.slider);
    EXPECT_EQ(Text(c.tool, c.label), c.caption);
    EXPECT_EQ(Text(c.tool, c.number), c.initial);
    EXPECT_EQ(slider->maximum(), c.maximum);
    slider->setValue(c.position - 1);
    slider->setValue(c.position);
    EXPECT_EQ(Text(c.tool, c.number), c.shown);
    const int steps = Steps();
    ToolChild<QPushButton>(c.tool, "Button1")->click();
    EXPECT_EQ(Working(),
              Expected(spec, Main().Document().Source(), spec.params[0].name, {c.position}, seed));
    EXPECT_EQ(Steps(), steps + 1);
    EXPECT_EQ(Main().StatusText(), QString::fromStdString(spec.statusText));
  }
  EXPECT_EQ(Text(5, "Label9"), "51");  // Round(45 * 100 / 89), not the "50" it starts with
  // Brume goes on drawing where its last run stopped, so a second OK gives another picture.
  const TBitmap32 first = Working();
  ToolChild<QPushButton>(10, "Button1")->click();
  EXPECT_EQ(Working(), Expected(*FindEffect(10), Main().Document().Source(), "scope", {9}, seed));
  EXPECT_NE(Working(), first);
}

TEST_F(ColorWindows, KernelWindowsConvertTheCellsAsTypedAndRefuseWhatIsNoInteger) {
  struct Case {
    int tool;
    const char *convertHint, *defaultHint;
  };
  const Case cases[] = {{6, "Convert with this setup", "Default setup"},
                        {7, "Convert with this setup", "Default setup"},
                        {8, "Convert with your setup", "Convert with default setup"}};
  for (const Case& c : cases) {
    const EffectSpec& spec = Open(c.tool);
    SCOPED_TRACE(spec.cliName);
    EXPECT_EQ(Text(c.tool, "Label1"), "You can change the figures");
    auto cell = [&](int i) {
      return ToolChild<QLineEdit>(c.tool, ("Edit" + std::to_string(i)).c_str());
    };
    EXPECT_EQ(cell(1)->toolTip(), "Change the number to get different effect");
    auto* convert = ToolChild<QPushButton>(c.tool, "Button1");
    auto* restore = ToolChild<QPushButton>(c.tool, "Button3");
    EXPECT_EQ(convert->text() + "/" + convert->toolTip(), QString("Convert/") + c.convertHint);
    EXPECT_EQ(restore->text() + "/" + restore->toolTip(), QString("Default/") + c.defaultHint);

    const int steps = Steps();
    EffectParams::Values typed = spec.params[0].defaultList;
    typed[4] = 3;
    cell(5)->setText("3");
    EXPECT_EQ(cell(9)->text(), QString::number(typed[8]));
    convert->click();
    std::uint32_t seed = 0;
    EXPECT_EQ(Working(), Expected(spec, Main().Document().Source(), "kernel", typed, seed));
    EXPECT_EQ(Steps(), steps + 1);
    EXPECT_EQ(Main().StatusText(), QString::fromStdString(spec.statusText));

    // A cell that is no 32-bit integer: the standard error, and nothing changes.
    const TBitmap32 before = Working();
    Main().SetStatusText("before");
    for (const char* bad : {"abc", "2147483648"}) {
      cell(2)->setText(bad);
      convert->click();
      EXPECT_EQ(platform_.errors.back(), QString("'%1' is not a valid integer value").arg(bad));
    }
    platform_.errors.clear();
    EXPECT_EQ(Working(), before);
    EXPECT_EQ(Steps(), steps + 1);
    EXPECT_EQ(Main().StatusText(), "before");

    restore->click();
    EXPECT_EQ(cell(2)->text(), QString::number(spec.params[0].defaultList[1]));
    EXPECT_EQ(Working(), Expected(spec, Main().Document().Source(), "kernel",
                                  spec.params[0].defaultList, seed));
    EXPECT_EQ(Steps(), steps + 2);
  }
}

TEST_F(ColorWindows, EachBatchWritesItsTagAndRecordsAStepPerPicture) {
  std::filesystem::create_directories(LocalPath("in"));
  SaveBitmap24(TestPicture(9, 7), LocalPath("in/a.bmp"));
  SaveBitmap24(TestPicture(12, 5), LocalPath("in/b.bmp"));
  platform_.folderAnswers.push_back(Path("in"));
  Open(5);
  ToolChild<QToolButton>(5, "SpeedButton2")->click();
  const QStringList files = Main().BatchFiles();
  ASSERT_EQ(files.size(), 2);
  auto input = [&](int i) {
    TBitmap32 picture = *LoadPictureFile(LocalPath("in/" + files[i]));
    SetAlphaChannel(picture, 255);
    return picture;
  };

  // A kernel cell that is no integer stops Convert before any picture is loaded.
  Open(6);
  ToolChild<QLineEdit>(6, "Edit4")->setText("x");
  ToolChild<QLineEdit>(6, "Edit11")->setText(Path("out"));
  ToolChild<QToolButton>(6, "SpeedButton4")->click();
  EXPECT_EQ(platform_.errors, std::vector<QString>{"'x' is not a valid integer value"});
  EXPECT_FALSE(Exists("out"));
  EXPECT_EQ(Main().Document().Source(), TestPicture());
  ToolChild<QLineEdit>(6, "Edit4")->setText("0");

  for (int tool : {5, 6, 7, 8, 9, 10}) {
    const EffectSpec& spec = Open(tool);
    SCOPED_TRACE(spec.batchTag);
    ToolChild<QLineEdit>(tool, spec.outputField.c_str())->setText(Path("out"));
    const int steps = Steps();
    std::uint32_t seed = Main().Document().RandomState();
    ToolChild<QToolButton>(tool, "SpeedButton4")->click();
    for (const QString& name : files)
      EXPECT_TRUE(
          Exists("out/" + name.chopped(4) + "-" + QString::fromStdString(spec.batchTag) + ".jpg"));
    EXPECT_EQ(Steps(), steps + 2);
    EXPECT_EQ(Main().StatusText(), QString::fromStdString(spec.statusText));
    // The last picture's result; brume's draws go on from the first picture to the second.
    const std::string& param = spec.params[0].name;
    Expected(spec, input(0), param, DefaultValue(spec.params[0]), seed);
    EXPECT_EQ(Working(), Expected(spec, input(1), param, DefaultValue(spec.params[0]), seed));
    EXPECT_EQ(Main().Document().RandomState(), seed);
  }
  EXPECT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
