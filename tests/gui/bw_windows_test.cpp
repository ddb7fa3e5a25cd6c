// The Pen sketch, Vuzorar and Pen and ink windows driven by their control names.
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QSlider>
#include <QToolButton>

#include "batch/batch_convert_ok.h"
#include "codecs/picture_file.h"
#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "tests/gui/temp_folder.h"

namespace quillane {
namespace {

class BwWindows : public FileGuiTest {
 protected:
  void Open(int tool) {
    const char* actions[] = {"", "Pencilsketch1", "Pensketch1", "Vuzorar1", "PenInk1"};
    MenuAction(actions[tool])->trigger();
  }
  template <typename T>
  T* Child(int tool, const char* name) {
    T* child = ToolChild<T>(tool, name);
    EXPECT_NE(child, nullptr) << name;
    return child;
  }
  QString Text(int tool, const char* label) { return Child<QLabel>(tool, label)->text(); }
};

TEST_F(BwWindows, ControlsAsDesigned) {
  struct Slider {
    int tool;
    const char *name, *label, *caption, *number, *start;
    int minimum, maximum, value, pageStep;
  };
  const Slider sliders[] = {
      {2, "TrackBar1", "Label8", "Pen Pressure:", "Label9", "128", 0, 255, 128, 0},
      {3, "TrackBar1", "Label8", "Vuzorar Pressure:", "Label9", "128", 0, 255, 128, 10},
      {3, "TrackBar2", "Label2", "Scope:", "Label3", "3", 1, 10, 3, 1},
      {4, "TrackBar1", "Label8", "Adjust thread:", "Label9", "128", 0, 255, 128, 0},
  };
  for (const Slider& s : sliders) {
    SCOPED_TRACE(s.caption);
    Open(s.tool);
    QSlider* slider = Child<QSlider>(s.tool, s.name);
    EXPECT_EQ(Text(s.tool, s.label), s.caption);
    EXPECT_EQ(Text(s.tool, s.number), s.start);
    EXPECT_EQ(slider->minimum(), s.minimum);
    EXPECT_EQ(slider->maximum(), s.maximum);
    EXPECT_EQ(slider->value(), s.value);
    if (s.pageStep != 0) {
      EXPECT_EQ(slider->pageStep(), s.pageStep);
    }
    slider->setValue(s.maximum - 1);
    EXPECT_EQ(Text(s.tool, s.number), QString::number(s.maximum - 1));
  }
  const char* titles[] = {"Pen_Sketch", "Vuzorar", "Pen_and_Ink"};
  for (int tool = 2; tool <= 4; ++tool) EXPECT_EQ(Tool(tool).windowTitle(), titles[tool - 2]);
  EXPECT_EQ(Text(3, "Label1"), "Direction:");
  const char* captions[] = {"///", "\\\\\\", "| | |", "=="};
  for (int i = 0; i < 4; ++i) {
    const std::string name = "RadioButton" + std::to_string(i + 1);
    EXPECT_EQ(Child<QRadioButton>(3, name.c_str())->text(), captions[i]);
    EXPECT_EQ(Child<QRadioButton>(3, name.c_str())->isChecked(), i == 0);
  }
  EXPECT_EQ(Child<QCheckBox>(4, "CheckBox1")->text(), "Color Ink");
  EXPECT_FALSE(Child<QCheckBox>(4, "CheckBox1")->isChecked());
}

TEST_F(BwWindows, OkDrawsRecordsAndSetsTheLineArtFlag) {
  const TBitmap32 source = Main().Document().Source();
  struct Case {
    int tool;
    const char* status;
    TBitmap32 expected;
  };
  const Case cases[] = {
      {2, "Pen Sketch", PenSketch(source, 128)},
      {3, "Vuzorar", Vuzorar(source, 128, 3, HatchDirection::Rising)},
      {4, "Pen and Ink", Pen_and_Ink(source, 128, false)},
  };
  int steps = 0;
  for (const Case& c : cases) {
    SCOPED_TRACE(c.status);
    Open(c.tool);
    Main().SetLineArt(false);
    EXPECT_FALSE(Child<QToolButton>(c.tool, "Button2")->isEnabled());
    Child<QPushButton>(c.tool, "Button1")->click();
    EXPECT_EQ(Main().Document().Working(), c.expected);
    EXPECT_EQ(Main().Document().UndoCount(), ++steps);
    EXPECT_EQ(Main().StatusText(), c.status);
    EXPECT_TRUE(Main().LineArt());
    EXPECT_TRUE(Child<QToolButton>(c.tool, "Button2")->isEnabled());
  }
}

TEST_F(BwWindows, VuzorarDirectionResetsOnShowingPenAndInkColourStays) {
  const TBitmap32 source = Main().Document().Source();
  Open(3);
  Child<QRadioButton>(3, "RadioButton3")->click();
  Child<QSlider>(3, "TrackBar2")->setValue(5);
  Child<QPushButton>(3, "Button1")->click();
  EXPECT_EQ(Main().Document().Working(), Vuzorar(source, 128, 5, HatchDirection::Vertical));
  Open(4);
  Child<QCheckBox>(4, "CheckBox1")->click();
  Child<QSlider>(4, "TrackBar1")->setValue(90);
  Open(3);
  EXPECT_TRUE(Child<QRadioButton>(3, "RadioButton1")->isChecked());
  EXPECT_EQ(Child<QSlider>(3, "TrackBar2")->value(), 5);
  Child<QPushButton>(3, "Button1")->click();
  EXPECT_EQ(Main().Document().Working(), Vuzorar(source, 128, 5, HatchDirection::Rising));
  Open(4);
  EXPECT_TRUE(Child<QCheckBox>(4, "CheckBox1")->isChecked());
  Child<QPushButton>(4, "Button1")->click();
  EXPECT_EQ(Main().Document().Working(), Pen_and_Ink(source, 90, true));
}

TEST_F(BwWindows, ConvertRecordsOneStepPerPictureUnderEachTag) {
  std::filesystem::create_directories(LocalPath("in"));
  SaveBitmap24(TestPicture(19, 13), LocalPath("in/a.bmp"));
  SaveBitmap24(TestPicture(8, 21), LocalPath("in/b.bmp"));
  const char* tags[] = {"PenSketch", "Vuzorar", "Pen_and_Ink"};
  int steps = 0;
  for (int tool = 2; tool <= 4; ++tool) {
    const std::string tag = tags[tool - 2];
    SCOPED_TRACE(tag);
    Open(tool);
    Child<QToolButton>(tool, "SpeedButton1")->click();
    platform_.folderAnswers.push_back(Path("in"));
    Child<QToolButton>(tool, "SpeedButton2")->click();
    Child<QLineEdit>(tool, "Edit2")->setText(Path("out"));
    Main().SetLineArt(false);
    Child<QToolButton>(tool, "SpeedButton4")->click();
    EXPECT_TRUE(platform_.errors.empty());
    EXPECT_TRUE(Exists(QString::fromStdString("out/a-" + tag + ".jpg")));
    EXPECT_TRUE(Exists(QString::fromStdString("out/b-" + tag + ".jpg")));
    steps += 2;
    EXPECT_EQ(Main().Document().UndoCount(), steps);
    EXPECT_EQ(Main().Document().Working(),
              FindEffect(tool)->routine({Main().Document().Source(), Main().Document().Source(),
                                         FindEffect(tool)->Defaults()}));
    EXPECT_TRUE(Main().LineArt());
    Main().BatchConvertOk().close();
  }
}

}  // namespace
}  // namespace quillane
