// The windows of the ColorAdjust and Veins menus, driven by their control names.
#include <QCheckBox>
#include <QPushButton>
#include <QRadioButton>

#include "data/texture_tiles.h"
#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/surface/emboss.h"
#include "effects/surface/stria.h"
#include "effects/surface/texture.h"
#include "tests/gui/window_helpers.h"
#include "ui/effects/preview_window.h"
#include "ui/effects/snapshot_window.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

using AdjustWindows = WindowTest;

// The settings that go back to their defaults on every showing share one path; HSL shows it.
TEST_F(AdjustWindows, HslAdjustShowsSignedNumbersAndStartsNeutralOnEveryShowing) {
  Open(kHslAdjust);
  for (auto [position, shown] : {std::pair{0, "-100"}, {270, "50"}}) {
    Slide(kHslAdjust, "TrackBar1", position);
    EXPECT_EQ(Text(kHslAdjust, "Label4"), shown) << position;
  }
  Slide(kHslAdjust, "TrackBar2", 0);
  Slide(kHslAdjust, "TrackBar3", 130);
  Press(kHslAdjust, "Button1");
  EXPECT_EQ(Working(), HslAdjust(Source(), 270, 0, 130));
  Tool(kHslAdjust).close();
  Open(kHslAdjust);
  EXPECT_EQ(Child<QSlider>(kHslAdjust, "TrackBar1")->value(), 180);
  EXPECT_EQ(Text(kHslAdjust, "Label9"), "0");
}

TEST_F(AdjustWindows, StriaTakesItsColourFromTheDialogAndStartsFromTheSnapshot) {
  Open(kEmboss);
  Press(kEmboss, "Button2");
  const Bitmap32 embossed = Working();
  Open(kStria);
  Slide(kStria, "TrackBar1", 40);
  Slide(kStria, "TrackBar3", 2);
  Press(kStria, "RadioButton2");
  platform_.colorAnswers.push_back(0x0000FF);
  ClickOn(Child(kStria, "ColorPanel"));
  EXPECT_EQ(platform_.colorRequests, std::vector<std::uint32_t>{0});

  // With "For current" both presses start from the picture as it was when the window opened.
  const Bitmap32 expected = stria(embossed, Source().Width(), Source().Height(),
                                  StriaDirection::Horizontal, 2, 2, 40, 0xFF);
  for (int press = 1; press <= 2; ++press) {
    Press(kStria, "Button1");
    EXPECT_EQ(Working(), expected);
  }
  Child<QCheckBox>(kStria, "CheckBox1")->setChecked(false);
  Press(kStria, "Button1");
  EXPECT_EQ(Working(), stria(Source(), Source().Width(), Source().Height(),
                             StriaDirection::Horizontal, 2, 2, 40, 0xFF));
}

TEST_F(AdjustWindows, TextureTileClicksChooseAndOkStartsFromTheSnapshot) {
  Open(kTexture);
  EXPECT_TRUE(Child<QRadioButton>(kTexture, "RadioButton4")->isChecked());
  Slide(kTexture, "TrackBar1", 80);
  ClickOn(Child(kTexture, "texture7"));
  EXPECT_TRUE(Child<QRadioButton>(kTexture, "RadioButton7")->isChecked());
  // Starting from the snapshot is Stria's test.
  Press(kTexture, "Button1");
  EXPECT_EQ(Working(), texture(Source(), TextureTile(7), 80));
}

// Stria and Texture share the snapshot window; Texture's batch shows it.
TEST_F(AdjustWindows, SnapshotBatchesWorkOnEachSourceAndRefreshTheSnapshot) {
  MakeInput({TestPicture(13, 9)});
  Open(kTexture);
  EXPECT_EQ(Convert(kTexture), std::vector<std::string>{"a-Texture.jpg"});
  EXPECT_FALSE(Child<QCheckBox>(kTexture, "CheckBox1")->isChecked());
  EXPECT_EQ(Working(), texture(Source(), TextureTile(4), 50));
  EXPECT_EQ(dynamic_cast<SnapshotWindow&>(Tool(kTexture)).Snapshot(), Working());
  EXPECT_EQ(Steps(), 1);
}

TEST_F(AdjustWindows, ColorPanelAppliesALayoutWhenItBecomesSelected) {
  Open(kColorPanel);
  const std::tuple<const char*, PanelLayout, const char*> cases[] = {
      {"RadioButton5", PanelLayout::Pane3x3, "Color Pane"},
      {"RadioButton6", PanelLayout::Catercorner16, "Color Catercorner"},
      {"RadioButton4", PanelLayout::Panel3x3, "Color Panels"}};
  int steps = 0;
  for (const auto& [button, layout, status] : cases) {
    Press(kColorPanel, button);
    EXPECT_EQ(Working(), ColorPanel(Source(), layout)) << button;
    EXPECT_EQ(Main().StatusText(), status);
    EXPECT_EQ(Steps(), ++steps);
  }
  Press(kColorPanel, "RadioButton4");  // already selected: nothing happens
  EXPECT_EQ(Steps(), steps);
}

// Panel 3 x 3 on a picture under 3 pixels leaves nothing to show; what follows must cope.
TEST_F(AdjustWindows, AnEmptyWorkingPictureIsRefusedWhereNothingCanBeDone) {
  Main().ShowNewPicture(TestPicture(2, 5), true);
  Open(kColorPanel);
  Press(kColorPanel, "RadioButton4");
  ASSERT_TRUE(Working().Empty());
  EXPECT_EQ(Main().StatusText(), "Color Panels");

  platform_.saveAnswers.push_back(FileChoice{Path("out.jpg"), 1});
  Main().OnSave();
  EXPECT_FALSE(Exists("out.jpg"));
  ASSERT_EQ(platform_.errors.size(), 1u);
  EXPECT_TRUE(platform_.errors[0].contains("no picture to save"))
      << platform_.errors[0].toStdString();
  Main().SetDisplaySize(250);

  Open(kStria);  // "For current": stripes over nothing
  Press(kStria, "Button1");
  EXPECT_TRUE(Working().Empty());
  Open(kEmboss);  // from the source, which is still there
  Press(kEmboss, "Button2");
  EXPECT_EQ(Working(), emboss(Source(), 100, 3));
  Main().OnUndo();
  Main().OnUndo();
  EXPECT_TRUE(Working().Empty());
  EXPECT_EQ(platform_.errors.size(), 1u);
}

TEST_F(AdjustWindows, ColorFilterPreviewsEachSwatchAndOkAppliesThePreview) {
  auto& window = dynamic_cast<PreviewWindow&>(Tool(kColorFilter));
  Open(kColorFilter);
  Press(kColorFilter, "Panel6");
  EXPECT_EQ(window.Preview(), ColorFilter(Source(), ColorFilterKind::Yellow));
  EXPECT_EQ(Child<PictureView>(kColorFilter, "Image2")->Image(), OpaqueImage(window.Preview()));
  ClickOn(Child(kColorFilter, "Image1"));  // Reset
  EXPECT_EQ(window.Preview(), Source());
  Press(kColorFilter, "Panel6");
  Press(kColorFilter, "Panel4");  // replaces, does not add
  EXPECT_EQ(Working(), Source());
  Press(kColorFilter, "Button1");
  EXPECT_EQ(Working(), ColorFilter(Source(), ColorFilterKind::Green));
  EXPECT_FALSE(Tool(kColorFilter).isVisible());
}

TEST_F(AdjustWindows, ColorVarietyAccumulatesClicksAndForCurrentStartsAgain) {
  Main().SetWorkingPicture(TestPicture(10, 30), true);
  auto& window = dynamic_cast<PreviewWindow&>(Tool(kColorVariety));
  Open(kColorVariety);
  for (const char* swatch : {"Panel6", "Panel6", "Panel3"}) Press(kColorVariety, swatch);
  EXPECT_EQ(window.Preview(), VarietyClicks(Source(), {4, 4, 1}));
  Child<QCheckBox>(kColorVariety, "CheckBox1")->setChecked(true);
  EXPECT_EQ(window.Preview(), TestPicture(10, 30));
  Press(kColorVariety, "Panel5");
  Press(kColorVariety, "Button1");
  EXPECT_EQ(Working(), variety(TestPicture(10, 30), 3));
  Open(kColorVariety);
  EXPECT_EQ(window.Preview(), Source());
}

}  // namespace
}  // namespace quillane
