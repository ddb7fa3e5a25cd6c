// Not a test: shows the main window with the pencil window (batch panel open) on a real
// display and saves the screen as a PNG, to look at the windows as a user sees them.
//   xvfb-run -a -s "-screen 0 1280x1024x24" ./gui_screenshot out.png [TOOL_NUMBER [colorup]]
// With "colorup" after a drawing window's number, its "Color up" opens the freehand windows
// too, and the whole screen is saved as out.png.colorup.png. A folder (starting with "/") in
// place of "colorup" is typed into the batch panel's Input and Output fields, to see how a long
// path shows.
#include <QApplication>
#include <QLineEdit>
#include <QScreen>
#include <QTimer>
#include <cstdlib>

#include "app/main_window.h"
#include "app/qt_platform.h"
#include "app/tool_windows.h"
#include "ui/tool_window.h"

int main(int argc, char* argv[]) {
  QApplication app(argc, argv);
  const QString out = argc > 1 ? QString::fromLocal8Bit(argv[1]) : "quillane.png";
  quillane::QtPlatformServices platform;
  quillane::MainWindow window(platform);
  quillane::CreateToolWindows(window);
  window.show();
  // The tool window to show (1 unless a number follows the file name), its batch panel open
  // and its effect applied.
  const int tool = argc > 2 ? std::atoi(argv[2]) : 1;
  window.OpenTool(tool);
  if (quillane::ToolWindow* open = window.ToolWindowAt(tool)) {
    open->ToggleBatchPanel();
    open->OnApply();
    if (argc > 3 && QString(argv[3]) == "colorup") open->OpenColorUp();
    if (argc > 3 && argv[3][0] == '/') {
      for (const std::string& name : {open->Spec().inputField, open->Spec().outputField})
        if (auto* field = open->findChild<QLineEdit*>(QString::fromStdString(name)))
          field->setText(QString::fromLocal8Bit(argv[3]) +
                         (name == open->Spec().outputField ? QStringLiteral("/out") : QString()));
    }
  }
  QTimer::singleShot(700, [&] {
    const QPixmap screen = QApplication::primaryScreen()->grabWindow(0);
    screen.copy(0, 0, 580, 500).save(out);
    if (argc > 3) screen.save(out + ".colorup.png");
    // The toolbar three times as large, to judge the glyphs.
    screen.copy(0, 20, 560, 40).scaled(1680, 120).save(out + ".toolbar.png");
    app.quit();
  });
  return app.exec();
}
