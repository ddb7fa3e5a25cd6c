// Driving the tool windows by their control names, and running their batches on real files.
#pragma once

#include <QLabel>
#include <QLineEdit>
#include <QSlider>
#include <QToolButton>
#include <initializer_list>

#include "codecs/picture_file.h"
#include "tests/gui/temp_folder.h"

namespace quillane {

class WindowTest : public FileGuiTest {
 protected:
  // Opens tool n from its menu entry.
  const EffectSpec& Open(int n) {
    MenuAction(QString::fromStdString(Tool(n).Spec().menuObjectName))->trigger();
    EXPECT_TRUE(Tool(n).isVisible());
    return Tool(n).Spec();
  }
  template <typename T = QWidget>
  T* Child(int n, const char* name) {
    T* child = ToolChild<T>(n, name);
    EXPECT_NE(child, nullptr) << name;
    return child;
  }
  QString Text(int n, const char* label) { return Child<QLabel>(n, label)->text(); }
  void Slide(int n, const char* slider, int value) { Child<QSlider>(n, slider)->setValue(value); }
  void Press(int n, const char* button) { Child<QAbstractButton>(n, button)->click(); }
  const Bitmap32& Working() { return Main().Document().Working(); }
  const Bitmap32& Source() { return Main().Document().Source(); }
  int Steps() { return Main().Document().UndoCount(); }

  // Pictures saved as a.bmp, b.bmp ... in folder "in".
  void MakeInput(std::initializer_list<Bitmap32> pictures) {
    std::filesystem::create_directories(LocalPath("in"));
    char name = 'a';
    for (const Bitmap32& picture : pictures)
      SaveBitmap24(picture, LocalPath(QString("in/%1.bmp").arg(name++)));
  }
  // The picture in.name as the document holds it once loaded.
  Bitmap32 Input(const QString& name) {
    Bitmap32 picture = *LoadPictureFile(LocalPath("in/" + name));
    SetAlphaChannel(picture, 255);
    return picture;
  }
  // Tool n converts folder "in" into "out" through its batch panel; the names in "out".
  std::vector<std::string> Convert(int n) {
    platform_.folderAnswers.push_back(Path("in"));
    Press(n, "SpeedButton2");
    Child<QLineEdit>(n, Tool(n).Spec().outputField.c_str())->setText(Path("out"));
    Press(n, "SpeedButton4");
    return Exists("out") ? Entries("out") : std::vector<std::string>{};
  }
};

}  // namespace quillane
