// The Pen sketch, Vuzorar and Pen and ink windows driven by their control names.
#include <QCheckBox>
#include <QRadioButton>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/vuzorar.h"
#include "tests/gui/window_helpers.h"

namespace quillane {
namespace {

using BwWindows = WindowTest;

// Status, steps and the line-art flag after OK are shared by every window: the batch and busy
// tests show them. Here the settings shown reach the drawing.
TEST_F(BwWindows, OkDrawsWithTheSettingsShown) {
  const TBitmap32 source = Source();
  Open(3);
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
