// The Pen sketch, Vuzorar and Pen and ink windows driven by their control names.

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/vuzorar.h"
#include "tests/gui/window_helpers.h"

namespace quillane {
namespace {

using BwWindows = WindowTest;

// Status, steps and the line-art flag after OK are shared by every window: the batch and busy
// tests show them, and the settings that go back on every showing are the HSL window's. Here a
// radio button, a slider and a check box reach the drawing.
TEST_F(BwWindows, OkDrawsWithTheSettingsShown) {
  const Bitmap32 source = Source();
  Open(kVuzorar);
  Press(kVuzorar, "RadioButton4");
  Slide(kVuzorar, "TrackBar2", 5);
  EXPECT_EQ(Text(kVuzorar, "Label3"), "5");  // the scope as it is, not a percentage
  Press(kVuzorar, "Button1");
  EXPECT_EQ(Working(), Vuzorar(source, 128, 5, HatchDirection::Horizontal));
  Open(kPenAndInk);
  Press(kPenAndInk, "CheckBox1");
  Press(kPenAndInk, "Button1");
  EXPECT_EQ(Working(), PenAndInk(source, 128, true));
}

}  // namespace
}  // namespace quillane
