// The Pen sketch, Vuzorar and Pen and ink windows driven by their control names.
#include <QCheckBox>
#include <QRadioButton>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "tests/gui/window_helpers.h"

namespace quillane {
namespace {

using BwWindows = WindowTest;

TEST_F(BwWindows, OkDrawsRecordsAndSetsTheLineArtFlagWithTheSettingsShown) {
  const TBitmap32 source = Source();
  const std::tuple<int, const char*, TBitmap32> cases[] = {
      {2, "Pen Sketch", PenSketch(source, 128)},
      {3, "Vuzorar", Vuzorar(source, 128, 3, HatchDirection::Rising)},
      {4, "Pen and Ink", Pen_and_Ink(source, 128, false)},
  };
  int steps = 0;
  for (const auto& [tool, status, expected] : cases) {
    SCOPED_TRACE(status);
    Open(tool);
    Main().SetLineArt(false);
    EXPECT_FALSE(Child<QToolButton>(tool, "Button2")->isEnabled());
    Press(tool, "Button1");
    EXPECT_EQ(Working(), expected);
    EXPECT_EQ(Steps(), ++steps);
    EXPECT_EQ(Main().StatusText(), status);
    EXPECT_TRUE(Main().LineArt());
    EXPECT_TRUE(Child<QToolButton>(tool, "Button2")->isEnabled());
  }
  // Captions and steps as the effect table gives them, one of each kind of control.
  EXPECT_EQ(Text(3, "Label2"), "Scope:");
  EXPECT_EQ(Child<QRadioButton>(3, "RadioButton2")->text(), "\\\\\\");
  EXPECT_EQ(Child<QCheckBox>(4, "CheckBox1")->text(), "Color Ink");
  EXPECT_EQ(Child<QSlider>(3, "TrackBar1")->pageStep(), 10);
  // Vuzorar's direction goes back to rising on every showing; the other settings stay.
  Press(3, "RadioButton3");
  Slide(3, "TrackBar2", 5);
  EXPECT_EQ(Text(3, "Label3"), "5");  // the scope as it is, not a percentage
  Press(4, "CheckBox1");
  Open(3);
  EXPECT_TRUE(Child<QRadioButton>(3, "RadioButton1")->isChecked());
  Press(3, "Button1");
  EXPECT_EQ(Working(), Vuzorar(source, 128, 5, HatchDirection::Rising));
  Open(4);
  Press(4, "Button1");
  EXPECT_EQ(Working(), Pen_and_Ink(source, 128, true));
  Open(3);
  Press(3, "RadioButton4");
  Press(3, "Button1");
  EXPECT_EQ(Working(), Vuzorar(source, 128, 5, HatchDirection::Horizontal));
}

}  // namespace
}  // namespace quillane
