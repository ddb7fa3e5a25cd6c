// Quillane: turns photographs into artwork.
#include <QApplication>

#include "app/main_window.h"
#include "app/qt_platform.h"
#include "app/tool_windows.h"

int main(int argc, char* argv[]) {
  QApplication app(argc, argv);
  QApplication::setApplicationName("Quillane");
  QApplication::setApplicationVersion("4.36");
  // The program ends when its main window closes, whatever tool window is still open.
  QApplication::setQuitOnLastWindowClosed(false);

  quillane::QtPlatformServices platform;
  quillane::TMyPicture mainWindow(platform);
  quillane::CreateToolWindows(mainWindow);
  QObject::connect(&mainWindow, &quillane::TMyPicture::closed, &app, &QApplication::quit);
  mainWindow.show();
  return app.exec();
}
