#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QSlider>
#include <QToolButton>
#include <functional>

#include "codecs/picture_file.h"
#include "effects/paint/abstract.h"
#include "effects/paint/brume.h"
#include "effects/paint/color_pencil.h"
#include "effects/paint/pop_art.h"
#include "effects/paint/realism.h"
#include "effects/paint/water_color.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

class ColorWindows : public FileGuiTest {
 protected:
  // Opens the window of tool number n from its menu entry.
  ToolWindow& Open(int n) {
    MenuAction(QString::fromStdString(Tool(n).Spec().menuHandler).chopped(5))->trigger();
    EXPECT_TRUE(Tool(n).isVisible());
    return Tool(n);
  }
  QString Text(int n, const char* label) { return ToolChild<QLabel>(n, label)->text(); }
  void Click(int n, const char* button) { ToolChild<QPushButton>(n, button)->click(); }
  const TBitmap32& Working() { return Main().Document().Working(); }
  const TBitmap32& Source() { return Main().Document().Source(); }
};

TEST_F(ColorWindows, ColorPencilShowsPressureAsPercentAndDrawsOnOk) {
  Open(5);
  auto* pressure = ToolChild<QSlider>(5, "TrackBar1");
  EXPECT_EQ(Text(5, "Label8"), "Pressure:");
  EXPECT_EQ(Text(5, "Label9"), "50");
  for (auto [position, shown] :
       {std::pair{46, "52"}, {45, "51"}, {89, "100"}, {0, "0"}, {60, "67"}}) {
    pressure->setValue(position);
    EXPECT_EQ(Text(5, "Label9"), shown);
  }
  Click(5, "Button1");
  EXPECT_EQ(Working(), colorsketch(Source(), 60));
  EXPECT_EQ(Main().Document().UndoCount(), 1);
  EXPECT_EQ(Main().StatusText(), "Color Sketch");
}

TEST_F(ColorWindows, ScopeSliderWindowsShowThePositionAndApplyIt) {
  struct Case {
    int tool;
    int maximum;
    const char* status;
    std::function<TBitmap32(const TBitmap32&, int)> effect;
  };
  const Case cases[] = {
      {9, 5, "Water color", [](const TBitmap32& s, int n) { return watercolor(s, n); }},
      {10, 10, "Brume",
       [](const TBitmap32& s, int a) {
         std::uint32_t seed = 0;  // the first run since the program started
         return Brume(s, a, seed);
       }},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.status);
    Open(c.tool);
    auto* scope = ToolChild<QSlider>(c.tool, "TrackBar2");
    EXPECT_EQ(Text(c.tool, "Label2"), "Scope:");
    EXPECT_EQ(Text(c.tool, "Label3"), "3");
    EXPECT_EQ(scope->minimum(), 1);
    EXPECT_EQ(scope->maximum(), c.maximum);
    EXPECT_EQ(scope->pageStep(), 1);
    scope->setValue(5);
    EXPECT_EQ(Text(c.tool, "Label3"), "5");
    const int steps = Main().Document().UndoCount();
    Click(c.tool, "Button1");
    EXPECT_EQ(Working(), c.effect(Source(), 5));
    EXPECT_EQ(Main().Document().UndoCount(), steps + 1);
    EXPECT_EQ(Main().StatusText(), c.status);
  }
  // Brume goes on drawing where its last run stopped, so a second OK gives another picture.
  std::uint32_t seed = 0;
  const TBitmap32 first = Brume(Source(), 5, seed);
  Click(10, "Button1");
  EXPECT_EQ(Working(), Brume(Source(), 5, seed));
  EXPECT_NE(Working(), first);
}

TEST_F(ColorWindows, KernelWindowsConvertTheCellsAsTypedAndRefuseWhatIsNoInteger) {
  struct Case {
    int tool;
    const char* caption;
    const char* status;
    const char* convertHint;
    const char* defaultHint;
    Kernel defaults;
    TBitmap32 (*effect)(const TBitmap32&, const Kernel&);
  };
  const Case cases[] = {
      {6,
       "Setup for Realism",
       "Realism",
       "Convert with this setup",
       "Default setup",
       {1, 2, 1, 0, 0, 0, -1, -1, -1},
       realism},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.status);
    ToolWindow& window = Open(c.tool);
    EXPECT_EQ(window.windowTitle(), c.caption);
    EXPECT_EQ(Text(c.tool, "Label1"), "You can change the figures");
    auto cell = [&](int i) {
      return ToolChild<QLineEdit>(c.tool, ("Edit" + std::to_string(i)).c_str());
    };
    for (int i = 1; i <= 9; ++i) {
      EXPECT_EQ(cell(i)->text(), QString::number(c.defaults[static_cast<std::size_t>(i - 1)]));
      EXPECT_EQ(cell(i)->toolTip(), "Change the number to get different effect");
    }
    auto* convert = ToolChild<QPushButton>(c.tool, "Button1");
    auto* restore = ToolChild<QPushButton>(c.tool, "Button3");
    EXPECT_EQ(convert->text(), "Convert");
    EXPECT_EQ(convert->toolTip(), c.convertHint);
    EXPECT_EQ(restore->text(), "Default");
    EXPECT_EQ(restore->toolTip(), c.defaultHint);

    const int steps = Main().Document().UndoCount();
    Kernel typed = c.defaults;
    typed[4] = 3;
    typed[8] = -7;
    cell(5)->setText("3");
    cell(9)->setText("-7");
    convert->click();
    EXPECT_EQ(Working(), c.effect(Source(), typed));
    EXPECT_EQ(Main().Document().UndoCount(), steps + 1);
    EXPECT_EQ(Main().StatusText(), c.status);

    // A cell that is no 32-bit integer: the standard error, and nothing changes.
    const TBitmap32 before = Working();
    Main().SetStatusText("before");
    for (const char* bad : {"abc", "2147483648", "1.5", ""}) {
      cell(2)->setText(bad);
      convert->click();
      ASSERT_FALSE(platform_.errors.empty());
      EXPECT_EQ(platform_.errors.back(), QString("'%1' is not a valid integer value").arg(bad));
    }
    EXPECT_EQ(platform_.errors.size(), 4u);
    platform_.errors.clear();
    EXPECT_EQ(Working(), before);
    EXPECT_EQ(Main().Document().UndoCount(), steps + 1);
    EXPECT_EQ(Main().StatusText(), "before");

    restore->click();
    for (int i = 1; i <= 9; ++i)
      EXPECT_EQ(cell(i)->text(), QString::number(c.defaults[static_cast<std::size_t>(i - 1)]));
    EXPECT_EQ(Working(), c.effect(Source(), c.defaults));
    EXPECT_EQ(Main().Document().UndoCount(), steps + 2);
    EXPECT_EQ(Main().StatusText(), c.status);
  }
}

TEST_F(ColorWindows, EachBatchWritesItsTagAndRecordsAStepPerPicture) {
  std::filesystem::create_directories(LocalPath("in"));
  SaveBitmap24(TestPicture(9, 7), LocalPath("in/a.bmp"));
  SaveBitmap24(TestPicture(12, 5), LocalPath("in/b.bmp"));
  platform_.folderAnswers.push_back(Path("in"));
  Open(5);
  ToolChild<QToolButton>(5, "SpeedButton1")->click();
  ToolChild<QToolButton>(5, "SpeedButton2")->click();
  const QStringList files = Main().BatchFiles();
  ASSERT_EQ(files.size(), 2);
  auto input = [&](const QString& name) {
    TBitmap32 picture = *LoadPictureFile(LocalPath("in/" + name));
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
    const EffectSpec& spec = Open(tool).Spec();
    SCOPED_TRACE(spec.batchTag);
    ToolChild<QLineEdit>(tool, spec.outputField.c_str())->setText(Path("out"));
    const int steps = Main().Document().UndoCount();
    const std::uint32_t seed = Main().Document().RandomState();
    ToolChild<QToolButton>(tool, "SpeedButton4")->click();
    for (const QString& name : files)
      EXPECT_TRUE(
          Exists("out/" + name.chopped(4) + "-" + QString::fromStdString(spec.batchTag) + ".jpg"));
    EXPECT_EQ(Main().Document().UndoCount(), steps + 2);
    EXPECT_EQ(Main().StatusText(), QString::fromStdString(spec.statusText));
    // The last picture's result; brume's draws go on from the first picture to the second.
    std::uint32_t expectedSeed = seed;
    EffectInput in{input(files[0]), input(files[0]), spec.Defaults(), &expectedSeed};
    spec.routine(in);
    const TBitmap32 last = input(files[1]);
    EXPECT_EQ(Working(), spec.routine({last, last, spec.Defaults(), &expectedSeed}));
    EXPECT_EQ(Main().Document().RandomState(), expectedSeed);
  }
  EXPECT_TRUE(platform_.errors.size() == 1 && platform_.messages.empty());
}

}  // namespace
}  // namespace quillane
