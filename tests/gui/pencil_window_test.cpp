// The Pencil sketch window: two sliders, the one moved last choosing the tone.
#include <QPushButton>

#include "effects/mono/bw_sketch.h"
#include "tests/gui/window_helpers.h"
#include "ui/effects/bw_sketch_window.h"

namespace quillane {
namespace {

class PencilWindow : public WindowTest {
 protected:
  void SetUp() override {
    WindowTest::SetUp();
    Open(kPencilSketch);
  }
  BwSketchWindow& Pencil() { return dynamic_cast<BwSketchWindow&>(Tool(kPencilSketch)); }
  Bitmap32 Sketch(PencilToneMode mode, int contrast, int lighting) {
    return PencilSketch(Source(), mode, contrast, lighting);
  }

  // Contrast chosen: Lighting's number in gray.
  void ExpectContrastMarked(bool contrast) {
    EXPECT_EQ(Pencil().ToneMode(), contrast ? PencilToneMode::Contrast : PencilToneMode::Lighting);
    EXPECT_EQ(Child<QLabel>(kPencilSketch, "Label3")->palette().color(QPalette::WindowText) ==
                  QColor(128, 128, 128),
              contrast);
  }
};

// OK's result, from the source each time, is the busy test's, which runs the pencil through it.
TEST_F(PencilWindow, TheSliderMovedLastChoosesTheToneUntilTheWindowIsShownAgain) {
  Slide(kPencilSketch, "TrackBar1", 30);
  ExpectContrastMarked(true);
  Slide(kPencilSketch, "TrackBar2", 90);
  ExpectContrastMarked(false);
  Press(kPencilSketch, "Button1");
  EXPECT_EQ(Working(), Sketch(PencilToneMode::Lighting, 30, 90));
  Slide(kPencilSketch, "TrackBar1", 60);
  ExpectContrastMarked(true);
  Press(kPencilSketch, "Button1");
  EXPECT_EQ(Working(), Sketch(PencilToneMode::Contrast, 60, 90));

  // Shown again, contrast is chosen; the sliders keep their places.
  Slide(kPencilSketch, "TrackBar2", 200);
  Pencil().close();
  Main().SetLineArt(true);
  Open(kPencilSketch);
  ExpectContrastMarked(true);
  EXPECT_FALSE(Main().LineArt());
  EXPECT_EQ(Text(kPencilSketch, "Label3"), "78");
  Press(kPencilSketch, "Button1");
  EXPECT_EQ(Working(), Sketch(PencilToneMode::Contrast, 60, 200));
}

}  // namespace
}  // namespace quillane
