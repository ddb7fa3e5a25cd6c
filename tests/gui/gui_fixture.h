// Shared set-up of the window tests: one QApplication for the test program, and a main window
// with all its tool windows on a scripted platform.
#pragma once

#include <gtest/gtest.h>

#include <QApplication>
#include <QMenuBar>
#include <QMouseEvent>
#include <QPointingDevice>
#include <QSettings>
#include <QString>
#include <QTemporaryDir>
#include <memory>

#include "app/main_window.h"
#include "app/tool_windows.h"
#include "tests/gui/scripted_platform.h"
#include "ui/tool_window.h"

namespace quillane {

// The tool windows by their effect, so that no test depends on where an effect stands in the
// registry's list.
inline int ToolNumber(const char* effect) {
  return FindEffectByCliName(effect)->toolNumber;
}
inline const int kPencilSketch = ToolNumber("pencil-sketch");
inline const int kPenSketch = ToolNumber("pen-sketch");
inline const int kVuzorar = ToolNumber("vuzorar");
inline const int kPenAndInk = ToolNumber("pen-and-ink");
inline const int kRealism = ToolNumber("realism");
inline const int kPopArt = ToolNumber("pop-art");
inline const int kHslAdjust = ToolNumber("hsl-adjust");
inline const int kColorVariety = ToolNumber("color-variety");
inline const int kColorPanel = ToolNumber("color-panel");
inline const int kTexture = ToolNumber("texture");
inline const int kEmboss = ToolNumber("emboss");
inline const int kColorFilter = ToolNumber("color-filter");
inline const int kStria = ToolNumber("stria");

inline QApplication& Application() {
  static int argc = 1;
  static char name[] = "gui_tests";
  static char* argv[] = {name, nullptr};
  // The toolkit's list of input devices, made before the application object so that it is
  // gone only after it.
  QInputDevice::devices();
  // Never destroyed: the input devices that window activation and key clicks create are
  // registered in a list of the toolkit's that static destruction removes before a static
  // application object, whose end would then crash deleting them.
  static QApplication& app = *new QApplication(argc, argv);
  // What the windows remember between runs (recent pictures, dialog folders) goes to a folder
  // of the test program's own, never to the user's settings.
  static QTemporaryDir settings;
  static const bool settingsMoved = [] {
    for (QSettings::Format format : {QSettings::NativeFormat, QSettings::IniFormat})
      QSettings::setPath(format, QSettings::UserScope, settings.path());
    return true;
  }();
  (void)settingsMoved;
  return app;
}

// One device of the tests' own for every synthesized mouse event of the program. Like the
// application object it is never destroyed: the toolkit's default one outlives the application
// object, and a second static one crashes when the program exits.
inline const QPointingDevice& TestMouse() {
  static const QPointingDevice& mouse = *new QPointingDevice(
      "test mouse", 1, QInputDevice::DeviceType::Mouse, QPointingDevice::PointerType::Generic,
      QInputDevice::Capability::Position, 1, 3);
  return mouse;
}

// A left click on a control that reacts to the mouse itself (colour panels, thumbnails, tiles).
inline void ClickOn(QWidget* control) {
  QMouseEvent release(QEvent::MouseButtonRelease, QPointF(4, 4), QPointF(4, 4), QPointF(4, 4),
                      Qt::LeftButton, Qt::NoButton, Qt::NoModifier, &TestMouse());
  QCoreApplication::sendEvent(control, &release);
}

// A small picture with a different colour in every pixel, so effects change it visibly.
inline Bitmap32 TestPicture(int width = 24, int height = 16) {
  Bitmap32 picture(width, height);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x)
      picture.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 10), static_cast<std::uint8_t>(y * 15),
                               static_cast<std::uint8_t>((x * y) % 256), 255};
  return picture;
}

// An effect that gives picture and leaves status in the status line.
inline EffectSpec Giving(Bitmap32 picture, std::string status) {
  return EffectSpec{.statusText = std::move(status),
                    .routine = [picture](const EffectInput&) { return picture; }};
}

class GuiTest : public ::testing::Test {
 protected:
  void SetUp() override {
    Application();
    main_ = std::make_unique<MainWindow>(platform_, TestPicture());
    CreateToolWindows(*main_);
    main_->show();
  }

  void TearDown() override { main_.reset(); }

  MainWindow& Main() { return *main_; }

  // A widget of the main window itself (not of a tool window) by object name.
  template <typename T>
  T* MainChild(const char* name) {
    return Main().centralWidget()->findChild<T*>(name);
  }

  QAction* MenuAction(const QString& name) { return Main().menuBar()->findChild<QAction*>(name); }

  ToolWindow& Tool(int number) { return *Main().ToolWindowAt(number); }

  template <typename T>
  T* ToolChild(int number, const char* name) {
    return Tool(number).findChild<T*>(name);
  }

  ScriptedPlatform platform_;
  std::unique_ptr<MainWindow> main_;
};

}  // namespace quillane
