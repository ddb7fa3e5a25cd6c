// The windows of the ColorAdjust and Veins menus, driven by their control names.
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QSlider>
#include <QToolButton>

#include "batch/batch_convert_ok.h"
#include "codecs/picture_file.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/adjust/preview_window.h"
#include "effects/surface/emboss.h"
#include "effects/surface/snapshot_window.h"
#include "effects/surface/stria.h"
#include "tests/gui/temp_folder.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

constexpr int kHsl = 11;
constexpr int kVariety = 12;
constexpr int kPanel = 13;
constexpr int kEmboss = 15;
constexpr int kFilter = 16;
constexpr int kStria = 17;

class AdjustWindows : public FileGuiTest {
 protected:
  ToolWindow& Open(const char* menuAction, int number) {
    MenuAction(menuAction)->trigger();
    return Tool(number);
  }
  QString Text(int number, const char* label) { return ToolChild<QLabel>(number, label)->text(); }
  void Slide(int number, const char* slider, int value) {
    ToolChild<QSlider>(number, slider)->setValue(value);
  }
  const TBitmap32& Source() { return Main().Document().Source(); }
  void ClickOn(int number, const char* name) {
    quillane::ClickOn(ToolChild<QWidget>(number, name));
  }
  const TBitmap32& Working() { return Main().Document().Working(); }

  // One picture in folder "in" converted by the open window into "out"; the output's name.
  std::vector<std::string> ConvertOnePicture(int number, const char* inputField,
                                             const char* outputField) {
    std::filesystem::create_directory(LocalPath("in"));
    SaveBitmap24(TestPicture(13, 9), LocalPath("in/p.bmp"));
    platform_.folderAnswers.push_back(Path("in"));
    ToolChild<QToolButton>(number, "SpeedButton1")->click();
    ToolChild<QToolButton>(number, "SpeedButton2")->click();
    ToolChild<QLineEdit>(number, outputField)->setText(Path("out"));
    EXPECT_EQ(ToolChild<QLineEdit>(number, inputField)->text(), Path("in"));
    ToolChild<QToolButton>(number, "SpeedButton4")->click();
    EXPECT_TRUE(Main().BatchConvertOk().isVisible());
    return Entries("out");
  }
};

TEST_F(AdjustWindows, EmbossAppliesOnButton2AndRecordsEachBatchPicture) {
  Open("Emboss1", kEmboss);
  EXPECT_EQ(Text(kEmboss, "Label9"), "100");
  EXPECT_EQ(Text(kEmboss, "Label3"), "3");
  Slide(kEmboss, "TrackBar2", 5);
  ToolChild<QPushButton>(kEmboss, "Button2")->click();
  EXPECT_EQ(Working(), emboss(Source(), 100, 5));
  EXPECT_EQ(Main().StatusText(), "Emboss");
  EXPECT_EQ(ConvertOnePicture(kEmboss, "Edit10", "Edit11"),
            std::vector<std::string>{"p-Emboss.jpg"});
  EXPECT_EQ(Working(), emboss(Source(), 100, 5));
  EXPECT_EQ(Main().Document().UndoCount(), 2);
}

TEST_F(AdjustWindows, HslAdjustShowsSignedNumbersAndStartsNeutralOnEveryShowing) {
  Open("HSLadjust1", kHsl);
  EXPECT_EQ(ToolChild<QToolButton>(kHsl, "SpeedButton1"), nullptr);
  for (const char* label : {"Label4", "Label3", "Label9"}) EXPECT_EQ(Text(kHsl, label), "0");
  for (auto [position, shown] : {std::pair{0, "-100"}, {181, "1"}, {270, "50"}}) {
    Slide(kHsl, "TrackBar1", position);
    EXPECT_EQ(Text(kHsl, "Label4"), shown) << position;
  }
  Slide(kHsl, "TrackBar2", 0);
  Slide(kHsl, "TrackBar3", 130);
  EXPECT_EQ(Text(kHsl, "Label3"), "-100");
  ToolChild<QPushButton>(kHsl, "Button1")->click();
  EXPECT_EQ(Working(), HslAdjust(Source(), 270, 0, 130));
  EXPECT_EQ(Main().StatusText(), "HSL Adjusted");
  EXPECT_EQ(Main().Document().UndoCount(), 1);

  Tool(kHsl).close();
  Open("HSLadjust1", kHsl);
  EXPECT_EQ(ToolChild<QSlider>(kHsl, "TrackBar1")->value(), 180);
  EXPECT_EQ(Text(kHsl, "Label9"), "0");
}

TEST_F(AdjustWindows, StriaTakesItsColourFromTheDialogAndStartsFromTheSnapshot) {
  Open("Emboss1", kEmboss);
  ToolChild<QPushButton>(kEmboss, "Button2")->click();
  const TBitmap32 embossed = Working();
  Open("Verticalstria1", kStria);
  EXPECT_EQ(Text(kStria, "Label9"), "50");
  Slide(kStria, "TrackBar1", 40);
  EXPECT_EQ(Text(kStria, "Label9"), "16");
  Slide(kStria, "TrackBar3", 2);
  ToolChild<QRadioButton>(kStria, "RadioButton2")->setChecked(true);
  platform_.colorAnswers.push_back(0x0000FF);
  ClickOn(kStria, "ColorPanel");
  EXPECT_EQ(platform_.colorRequests, std::vector<std::uint32_t>{0});

  // With "For current" both presses start from the picture as it was when the window opened.
  const TBitmap32 expected = stria(embossed, Source().Width(), Source().Height(),
                                   StriaDirection::Horizontal, 2, 2, 40, 0xFF);
  for (int press = 1; press <= 2; ++press) {
    ToolChild<QPushButton>(kStria, "Button1")->click();
    EXPECT_EQ(Working(), expected);
    EXPECT_EQ(Main().StatusText(), "Added stria");
    EXPECT_EQ(Main().Document().UndoCount(), 1 + press);
  }
  ToolChild<QCheckBox>(kStria, "CheckBox1")->setChecked(false);
  ToolChild<QPushButton>(kStria, "Button1")->click();
  EXPECT_EQ(Working(), stria(Source(), Source().Width(), Source().Height(),
                             StriaDirection::Horizontal, 2, 2, 40, 0xFF));
  Tool(kStria).close();
  Open("Verticalstria1", kStria);
  EXPECT_TRUE(ToolChild<QCheckBox>(kStria, "CheckBox1")->isChecked());
}

TEST_F(AdjustWindows, StriaBatchStripesEachSourceAndRefreshesTheSnapshot) {
  Open("Verticalstria1", kStria);
  EXPECT_EQ(ConvertOnePicture(kStria, "Edit1", "Edit2"), std::vector<std::string>{"p-Stria.jpg"});
  EXPECT_FALSE(ToolChild<QCheckBox>(kStria, "CheckBox1")->isChecked());
  EXPECT_EQ(Working(), stria(Source(), 13, 9, StriaDirection::Vertical, 1, 2, 128, 0));
  EXPECT_EQ(dynamic_cast<SnapshotWindow&>(Tool(kStria)).Snapshot(), Working());
  EXPECT_EQ(Main().Document().UndoCount(), 1);
}

TEST_F(AdjustWindows, ColorPanelAppliesALayoutWhenItBecomesSelected) {
  Open("Colorpanel1", kPanel);
  EXPECT_EQ(ToolChild<QPushButton>(kPanel, "Button1"), nullptr);
  const auto click = [&](const char* name) { ToolChild<QRadioButton>(kPanel, name)->click(); };
  struct Case {
    const char* button;
    PanelLayout layout;
    const char* status;
  } const cases[] = {{"RadioButton5", PanelLayout::Pane3x3, "Color Pane"},
                     {"RadioButton6", PanelLayout::Catercorner16, "Color Catercorner"},
                     {"RadioButton4", PanelLayout::Panel3x3, "Color Panels"}};
  int steps = 0;
  for (const Case& c : cases) {
    click(c.button);
    EXPECT_EQ(Working(), ColorPanel(Source(), c.layout)) << c.button;
    EXPECT_EQ(Main().StatusText(), c.status);
    EXPECT_EQ(Main().Document().UndoCount(), ++steps);
  }
  click("RadioButton4");  // already selected: nothing happens
  EXPECT_EQ(Main().Document().UndoCount(), steps);
  Tool(kPanel).close();
  Open("Colorpanel1", kPanel);
  EXPECT_TRUE(ToolChild<QRadioButton>(kPanel, "RadioButton4")->isChecked());
}

// Panel 3 x 3 on a picture under 3 pixels leaves nothing to show; what follows must cope.
TEST_F(AdjustWindows, AnEmptyWorkingPictureIsRefusedWhereNothingCanBeDone) {
  Main().ShowNewPicture(TestPicture(2, 5), true);
  Open("Colorpanel1", kPanel);
  ToolChild<QRadioButton>(kPanel, "RadioButton4")->click();
  ASSERT_TRUE(Working().Empty());
  EXPECT_EQ(Main().StatusText(), "Color Panels");

  platform_.saveAnswers.push_back(FileChoice{Path("out.jpg"), 1});
  Main().SpeedButton2Click();
  EXPECT_FALSE(Exists("out.jpg"));
  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains("no picture to save"))
      << platform_.errors[0].toStdString();
  Main().SetDisplaySize(250);

  Open("Verticalstria1", kStria);  // "For current": stripes over nothing
  ToolChild<QPushButton>(kStria, "Button1")->click();
  EXPECT_TRUE(Working().Empty());
  Open("Emboss1", kEmboss);  // from the source, which is still there
  ToolChild<QPushButton>(kEmboss, "Button2")->click();
  EXPECT_EQ(Working(), emboss(Source(), 100, 3));
  Main().SpeedButton3Click();
  Main().SpeedButton3Click();
  EXPECT_TRUE(Working().Empty());
  EXPECT_EQ(platform_.errors.size(), 1u);
}

TEST_F(AdjustWindows, ColorFilterPreviewsEachSwatchAndOkAppliesThePreview) {
  Open("ColorFilter2", kFilter);
  auto& window = dynamic_cast<PreviewWindow&>(Tool(kFilter));
  const auto* image2 = ToolChild<PictureView>(kFilter, "Image2");
  EXPECT_EQ(ToolChild<PictureView>(kFilter, "Image1")->geometry(), QRect(2, 19, 105, 72));
  EXPECT_EQ(image2->geometry(), QRect(2, 19, 105, 72));
  ToolChild<QRadioButton>(kFilter, "Panel6")->click();
  EXPECT_EQ(window.Preview(), filter(Source(), ColorFilterKind::Yellow));
  EXPECT_EQ(image2->Image(), OpaqueImage(window.Preview()));
  ClickOn(kFilter, "Image1");  // Reset
  EXPECT_EQ(window.Preview(), Source());
  ToolChild<QRadioButton>(kFilter, "Panel6")->click();  // the same swatch again after a reset
  EXPECT_EQ(window.Preview(), filter(Source(), ColorFilterKind::Yellow));
  ToolChild<QRadioButton>(kFilter, "Panel4")->click();  // replaces, does not add
  EXPECT_EQ(Working(), Source());
  ToolChild<QPushButton>(kFilter, "Button1")->click();
  EXPECT_EQ(Working(), filter(Source(), ColorFilterKind::Green));
  EXPECT_EQ(Main().StatusText(), "Color Filter");
  EXPECT_EQ(Main().Document().UndoCount(), 1);
  EXPECT_FALSE(Tool(kFilter).isVisible());
  EXPECT_EQ(Main().ActiveTool(), 0);
}

TEST_F(AdjustWindows, ColorVarietyAccumulatesClicksAndForCurrentStartsAgain) {
  Main().SetWorkingPicture(TestPicture(10, 30), true);
  Open("Colorvariety1", kVariety);
  auto& window = dynamic_cast<PreviewWindow&>(Tool(kVariety));
  EXPECT_EQ(window.Base(), Source());
  for (const char* swatch : {"Panel6", "Panel6", "Panel3"})
    ToolChild<QPushButton>(kVariety, swatch)->click();
  EXPECT_EQ(window.Preview(), VarietyClicks(Source(), {4, 4, 1}));
  ToolChild<QCheckBox>(kVariety, "CheckBox1")->setChecked(true);
  EXPECT_EQ(window.Preview(), TestPicture(10, 30));
  EXPECT_EQ(ToolChild<PictureView>(kVariety, "Image1")->geometry(), QRect(37, 2, 37, 105));
  ToolChild<QPushButton>(kVariety, "Panel5")->click();
  ToolChild<QPushButton>(kVariety, "Button1")->click();
  EXPECT_EQ(Working(), variety(TestPicture(10, 30), 3));
  EXPECT_EQ(Main().StatusText(), "Color Varied");
  EXPECT_EQ(Main().Document().UndoCount(), 2);
  Open("Colorvariety1", kVariety);
  EXPECT_FALSE(ToolChild<QCheckBox>(kVariety, "CheckBox1")->isChecked());
  EXPECT_EQ(window.Preview(), Source());
}

}  // namespace
}  // namespace quillane
