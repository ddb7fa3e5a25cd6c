// The Pen sketch, Vuzorar and Pen and ink windows driven by their control names.
#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPushButton>
#include <QRadioButton>
#include <QSlider>
#include <QToolButton>

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
    const char* actions[] = {"", "", "Pensketch1", "Vuzorar1", "PenInk1"};
    MenuAction(actions[tool])->trigger();
  }
  template <typename T>
  T* Child(int tool, const char* name) {
    T* child = ToolChild<T>(tool, name);
    EXPECT_NE(child, nullptr) << name;
    return child;
  }
  QString Text(int tool, const char* label) { return Child<QLabel>(tool, label)->text(); }
  void Ok(int tool) { Child<QPushButton>(tool, "Button1")->click(); }
};

TEST_F(BwWindows, ControlsAsDesigned) {
  struct Slider {
    int tool;
    const char *name, *label, *caption, *number, *start;
    int minimum, maximum, pageStep;
  };
  for (const Slider& s :
       {Slider{2, "TrackBar1", "Label8", "Pen Pressure:", "Label9", "128", 0, 255, 10},
        {3, "TrackBar1", "Label8", "Vuzorar Pressure:", "Label9", "128", 0, 255, 10},
        {3, "TrackBar2", "Label2", "Scope:", "Label3", "3", 1, 10, 1},
        {4, "TrackBar1", "Label8", "Adjust thread:", "Label9", "128", 0, 255, 10}}) {
    SCOPED_TRACE(s.caption);
    QSlider* slider = Child<QSlider>(s.tool, s.name);
    EXPECT_EQ(Text(s.tool, s.label), s.caption);
    EXPECT_EQ(Text(s.tool, s.number), s.start);
    EXPECT_EQ(QString::number(slider->value()), s.start);
    EXPECT_EQ(std::tuple(slider->minimum(), slider->maximum(), slider->pageStep()),
              std::tuple(s.minimum, s.maximum, s.pageStep));
    slider->setValue(s.maximum - 1);
    EXPECT_EQ(Text(s.tool, s.number), QString::number(s.maximum - 1));
  }
  EXPECT_EQ(Text(3, "Label1"), "Direction:");
  const char* captions[] = {"///", "\\\\\\", "| | |", "=="};
  for (int i = 0; i < 4; ++i) {
    const std::string name = "RadioButton" + std::to_string(i + 1);
    EXPECT_EQ(Child<QRadioButton>(3, name.c_str())->text(), captions[i]);
  }
  EXPECT_EQ(Child<QCheckBox>(4, "CheckBox1")->text(), "Color Ink");
}

TEST_F(BwWindows, OkDrawsRecordsAndSetsTheLineArtFlagWithTheSettingsShown) {
  const TBitmap32 source = Main().Document().Source();
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
    Ok(tool);
    EXPECT_EQ(Main().Document().Working(), expected);
    EXPECT_EQ(Main().Document().UndoCount(), ++steps);
    EXPECT_EQ(Main().StatusText(), status);
    EXPECT_TRUE(Main().LineArt());
    EXPECT_TRUE(Child<QToolButton>(tool, "Button2")->isEnabled());
  }
  // Vuzorar's direction goes back to rising on every showing; the other settings stay.
  Child<QRadioButton>(3, "RadioButton3")->click();
  Child<QSlider>(3, "TrackBar2")->setValue(5);
  Child<QCheckBox>(4, "CheckBox1")->click();
  Open(3);
  EXPECT_TRUE(Child<QRadioButton>(3, "RadioButton1")->isChecked());
  Ok(3);
  EXPECT_EQ(Main().Document().Working(), Vuzorar(source, 128, 5, HatchDirection::Rising));
  Open(4);
  Ok(4);
  EXPECT_EQ(Main().Document().Working(), Pen_and_Ink(source, 128, true));
  Open(3);
  Child<QRadioButton>(3, "RadioButton4")->click();
  Ok(3);
  EXPECT_EQ(Main().Document().Working(), Vuzorar(source, 128, 5, HatchDirection::Horizontal));
}

TEST_F(BwWindows, ConvertRecordsOneStepPerPictureUnderEachTag) {
  std::filesystem::create_directories(LocalPath("in"));
  SaveBitmap24(TestPicture(19, 13), LocalPath("in/a.bmp"));
  SaveBitmap24(TestPicture(8, 21), LocalPath("in/b.bmp"));
  for (auto [tool, tag] : {std::pair{2, "PenSketch"}, {3, "Vuzorar"}, {4, "Pen_and_Ink"}}) {
    SCOPED_TRACE(tag);
    Open(tool);
    Child<QToolButton>(tool, "SpeedButton1")->click();
    platform_.folderAnswers.push_back(Path("in"));
    Child<QToolButton>(tool, "SpeedButton2")->click();
    Child<QLineEdit>(tool, "Edit2")->setText(Path("out"));
    const int before = Main().Document().UndoCount();
    Main().SetLineArt(false);
    Child<QToolButton>(tool, "SpeedButton4")->click();
    EXPECT_TRUE(Exists(QString("out/a-%1.jpg").arg(tag)));
    EXPECT_TRUE(Exists(QString("out/b-%1.jpg").arg(tag)));
    EXPECT_EQ(Main().Document().UndoCount(), before + 2);
    EXPECT_TRUE(Main().LineArt());
  }
}

}  // namespace
}  // namespace quillane
