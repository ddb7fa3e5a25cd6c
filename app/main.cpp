// Quillane: turns photographs into artwork.
#include <QApplication>
#include <QCommandLineParser>
#include <QFileInfo>
#include <cstdio>
#include <exception>

#include "app/app_icon.h"
#include "app/main_window.h"
#include "app/qt_messages.h"
#include "app/qt_platform.h"
#include "app/tool_windows.h"
#include "imaging/picture_memory.h"

namespace {

// The last line of defence: an error that no command caught ends that command and is shown in
// the standard error box, instead of escaping into the event loop, which would end the
// program and lose the user's picture.
class Application : public QApplication {
 public:
  Application(int& argc, char** argv, quillane::PlatformServices& platform)
      : QApplication(argc, argv), platform_(platform) {}

  bool notify(QObject* receiver, QEvent* event) override {
    try {
      return QApplication::notify(receiver, event);
    } catch (const std::exception& e) {
      platform_.ShowError(QString::fromLocal8Bit(e.what()));
    } catch (...) {
      platform_.ShowError("An unexpected error ended the command.");
    }
    return false;
  }

 private:
  quillane::PlatformServices& platform_;
};

}  // namespace

int main(int argc, char* argv[]) {
  quillane::LimitRepeatedQtMessages();
  quillane::SetUpPictureMemory();
  quillane::QtPlatformServices platform;
  Application app(argc, argv, platform);
  QApplication::setApplicationName("Quillane");
  QApplication::setApplicationVersion(QUILLANE_VERSION);
  // The desktop entry's name, which Wayland compositors match the window to (icon, taskbar).
  QGuiApplication::setDesktopFileName("io.github.quillane.Quillane");
  QApplication::setWindowIcon(quillane::ApplicationIcon());

  QCommandLineParser parser;
  parser.setApplicationDescription("Turns photographs into artwork.");
  parser.addHelpOption();
  parser.addVersionOption();
  parser.addPositionalArgument("FILE",
                               "A picture to open (.jpg, .jpeg, .bmp, .ico, .gif, .wmf, "
                               ".emf); the built-in picture when none is given.",
                               "[FILE]");
  parser.process(app);
  const QStringList files = parser.positionalArguments();
  if (files.size() > 1) {
    std::fputs(qPrintable("Quillane opens one picture at a time.\n\n" + parser.helpText()), stderr);
    return 2;
  }
  // The program ends when its main window closes, whatever tool window is still open.
  QApplication::setQuitOnLastWindowClosed(false);

  quillane::MainWindow mainWindow(platform);
  quillane::CreateToolWindows(mainWindow);
  QObject::connect(&mainWindow, &quillane::MainWindow::closed, &app, &QApplication::quit);
  mainWindow.show();
  if (!files.isEmpty()) {
    if (QFileInfo(files.first()).isFile())
      mainWindow.OpenPictureFile(files.first());
    else
      platform.ShowMessage("Sorry", files.first() + " does not exist");
  }
  return app.exec();
}
