#include <QLabel>
#include <QPushButton>
#include <QSlider>
#include <QToolButton>

#include "effects/mono/bw_sketch.h"
#include "effects/mono/bw_sketch_window.h"
#include "tests/gui/gui_fixture.h"
#include "ui/picture_view.h"

namespace quillane {
namespace {

class PencilWindow : public GuiTest {
 protected:
  void SetUp() override {
    GuiTest::SetUp();
    MenuAction("Pencilsketch1")->trigger();
  }

  TBack_and_White_Sketch& Pencil() { return dynamic_cast<TBack_and_White_Sketch&>(Tool(1)); }
  QSlider* Slider(const char* name) { return ToolChild<QSlider>(1, name); }
  QLabel* Label(const char* name) { return ToolChild<QLabel>(1, name); }
  QString Text(const char* name) { return Label(name)->text(); }
  QColor Color(const char* name) { return Label(name)->palette().color(QPalette::WindowText); }
  void PressOk() { ToolChild<QPushButton>(1, "Button1")->click(); }

  // Contrast chosen: its labels in the window's text colour, Lighting's in gray.
  void ExpectContrastMarked(bool contrast) {
    const QColor text = Pencil().palette().color(QPalette::WindowText);
    const QColor gray(128, 128, 128);
    EXPECT_EQ(Color("Label1"), contrast ? text : gray);
    EXPECT_EQ(Color("Label4"), contrast ? text : gray);
    EXPECT_EQ(Color("Label2"), contrast ? gray : text);
    EXPECT_EQ(Color("Label3"), contrast ? gray : text);
  }
};

TEST_F(PencilWindow, NumberLabelsShowPercentOfTheRange) {
  EXPECT_EQ(Text("Label4"), "50");
  EXPECT_EQ(Text("Label3"), "50");
  EXPECT_FALSE(ToolChild<QToolButton>(1, "Button2")->isEnabled());
  ExpectContrastMarked(true);
  // Percent of the slider's range, rounded: 45 of 89 shows 51, not the "50" it started with.
  for (auto [value, shown] : {std::pair{46, "52"}, {45, "51"}, {0, "0"}, {89, "100"}}) {
    Slider("TrackBar1")->setValue(value);
    EXPECT_EQ(Text("Label4"), shown) << value;
  }
  for (auto [value, shown] : {std::pair{255, "100"}, {0, "0"}, {128, "50"}}) {
    Slider("TrackBar2")->setValue(value);
    EXPECT_EQ(Text("Label3"), shown) << value;
  }
  EXPECT_EQ(Text("Label4"), "100");
}

// Undo itself is the main window's test.
TEST_F(PencilWindow, OkDrawsThePictureAndRecordsIt) {
  Main().SetLineArt(true);
  const TBitmap32 source = Main().Document().Source();
  PressOk();
  const TBitmap32 expected = peccilsketch(source, PencilToneMode::Contrast, 45, 128);
  EXPECT_EQ(Main().Document().Working(), expected);
  EXPECT_EQ(Main().Document().Source(), source);
  EXPECT_EQ(Main().Document().UndoCount(), 1);
  EXPECT_EQ(Main().StatusText(), "Pencil Sketch");
  EXPECT_FALSE(Main().LineArt());
  EXPECT_TRUE(ToolChild<QToolButton>(1, "Button2")->isEnabled());
  EXPECT_TRUE(Main().centralWidget()->findChild<QToolButton*>("SpeedButton3")->isEnabled());
  EXPECT_EQ(Main().findChild<PictureView*>("Image1")->Image(), OpaqueImage(expected));

  // Applying again starts from the source picture, not from the drawing.
  PressOk();
  EXPECT_EQ(Main().Document().Working(), expected);
  EXPECT_EQ(Main().Document().UndoCount(), 2);
}

TEST_F(PencilWindow, TheSliderMovedLastChoosesTheTone) {
  const TBitmap32 source = Main().Document().Source();
  Slider("TrackBar1")->setValue(30);
  EXPECT_EQ(Pencil().ToneMode(), PencilToneMode::Contrast);
  Slider("TrackBar2")->setValue(90);
  EXPECT_EQ(Pencil().ToneMode(), PencilToneMode::Lighting);
  ExpectContrastMarked(false);
  PressOk();
  EXPECT_EQ(Main().Document().Working(), peccilsketch(source, PencilToneMode::Lighting, 30, 90));

  Slider("TrackBar1")->setValue(60);
  ExpectContrastMarked(true);
  PressOk();
  EXPECT_EQ(Main().Document().Working(), peccilsketch(source, PencilToneMode::Contrast, 60, 90));
}

TEST_F(PencilWindow, ShowingTheWindowAgainChoosesContrast) {
  Slider("TrackBar2")->setValue(200);
  ExpectContrastMarked(false);
  Pencil().close();
  Main().SetLineArt(true);
  MenuAction("Pencilsketch1")->trigger();

  EXPECT_EQ(Pencil().ToneMode(), PencilToneMode::Contrast);
  ExpectContrastMarked(true);
  EXPECT_FALSE(Main().LineArt());
  // The slider keeps its place between showings.
  EXPECT_EQ(Slider("TrackBar2")->value(), 200);
  EXPECT_EQ(Text("Label3"), "78");
  PressOk();
  EXPECT_EQ(Main().Document().Working(),
            peccilsketch(Main().Document().Source(), PencilToneMode::Contrast, 45, 200));
}

}  // namespace
}  // namespace quillane
