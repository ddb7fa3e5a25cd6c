// The export commands: printing the working picture, making it the desktop wallpaper, mailing
// it, and the Help menu. None of them changes the document.
#include <QAction>
#include <QApplication>
#include <QDir>
#include <QFrame>
#include <QMenuBar>
#include <QPainter>
#include <QPrinter>
#include <QStandardPaths>
#include <QToolButton>
#include <exception>
#include <new>

#include "app/about_box.h"
#include "app/desktop_handover.h"
#include "app/export_rules.h"
#include "app/local_path.h"
#include "app/main_window.h"
#include "codecs/picture_file.h"
#include "ui/picture_view.h"
#include "ui/platform.h"

#ifndef QUILLANE_SOURCE_DIR
#define QUILLANE_SOURCE_DIR ""
#endif
#ifndef QUILLANE_DOWNLOAD_PAGE
#define QUILLANE_DOWNLOAD_PAGE ""
#endif

namespace quillane {
namespace {

// The wallpaper and the mail attachment live in the user's own data folder: the program's
// folder is not writable once it is installed. Empty, with a message in reason, when the
// folder cannot be made.
QString ExportFolder(QString& reason) {
  const QString folder = QStandardPaths::writableLocation(QStandardPaths::AppDataLocation);
  if (folder.isEmpty()) {
    reason = "There is no folder for the program's files in your home folder";
    return {};
  }
  if (!QDir().mkpath(folder)) {
    reason = "Cannot create the folder " + folder;
    return {};
  }
  return folder;
}

QString DownloadPage() {
  const QString page = QUILLANE_DOWNLOAD_PAGE;
  // Without a published page the friend at least learns the program's name and version.
  return page.isEmpty() ? QStringLiteral("Quillane " QUILLANE_VERSION) : page;
}

}  // namespace

void MainWindow::ConnectExportCommands() {
  auto button = [this](const char* name) { return viewBand_->findChild<QToolButton*>(name); };
  connect(button("SpeedButton9"), &QToolButton::clicked, this, &MainWindow::OnSetWallpaper);
  connect(button("SpeedButton10"), &QToolButton::clicked, this, &MainWindow::OnPrint);
  connect(button("SpeedButton11"), &QToolButton::clicked, this, &MainWindow::OnMail);
  auto action = [this](const char* name) { return menuBar()->findChild<QAction*>(name); };
  connect(action("Online1"), &QAction::triggered, this, &MainWindow::OnOnlineHelp);
  connect(action("About1"), &QAction::triggered, this, &MainWindow::OnAbout);
  aboutBox_ = new AboutBox(this);
  aboutBox_->hide();
}

void MainWindow::OnPrint() {
  const Bitmap32& picture = document_.Working();
  // An empty picture would be doubled for ever in search of half a page.
  if (picture.Empty()) {
    platform_.ShowMessage("Sorry", "There is no picture to print");
    return;
  }
  QPrinter printer(QPrinter::HighResolution);
  if (!platform_.PrintDialog(printer)) return;
  const QRect target =
      PrintRectangle(picture.Width(), picture.Height(), printer.width(), printer.height());
  try {
    const QImage image = OpaqueImage(picture);
    QPainter painter;
    if (!painter.begin(&printer)) {
      platform_.ShowError("The printer could not start the print job");
      return;
    }
    painter.drawImage(target, image);
    if (!painter.end() || printer.printerState() == QPrinter::Error)
      platform_.ShowError("The printer reported an error; the page may not have been printed");
  } catch (const std::bad_alloc&) {
    platform_.ShowError("There is not enough memory to print the picture");
  }
}

void MainWindow::OnSetWallpaper() {
  QString reason;
  const QString folder = ExportFolder(reason);
  if (folder.isEmpty()) {
    platform_.ShowError(reason);
    return;
  }
  const QString file = QDir(folder).filePath("wallpaper.bmp");
  try {
    SaveBitmap32(document_.Working(), LocalPath(file));
  } catch (const std::exception& e) {
    platform_.ShowError(FromLocalPath(e.what()));
    return;
  }
  const HandOver result = SetDesktopWallpaper(file);
  if (result.accepted) {
    platform_.ShowMessage("ok!", "Set as wallpaper successful!");
  } else {
    platform_.ShowMessage("Sorry", "The wallpaper could not be set: " + result.reason +
                                       ".\nThe picture was saved as " + file);
  }
}

void MainWindow::OnMail() {
  QString reason;
  const QString folder = ExportFolder(reason);
  if (folder.isEmpty()) {
    platform_.ShowError(reason);
    return;
  }
  const QString file = QDir(folder).filePath("mywork.jpg");
  try {
    SaveJpeg(document_.Working(), LocalPath(file), 90);
  } catch (const std::exception& e) {
    platform_.ShowError(FromLocalPath(e.what()));
    return;
  }
  auto tell = [this, file](const QString& why) {
    platform_.ShowMessage("Sorry", "No mail program could be started: " + why +
                                       ".\nThe picture was saved as " + file);
  };
  const HandOver result = StartMailProgram(
      {"--subject", kMailSubject, "--body", MailBody(DownloadPage()), "--attach", file}, this,
      tell);
  if (!result.accepted) tell(result.reason);
}

void MainWindow::OnOnlineHelp() {
  const QString file =
      DocumentationFile(QCoreApplication::applicationDirPath(), QUILLANE_SOURCE_DIR);
  if (file.isEmpty()) {
    platform_.ShowMessage("Sorry", "The program's documentation (README.md) was not found");
  } else if (!platform_.OpenWithDefaultProgram(file)) {
    platform_.ShowMessage("Sorry", "No program could be started to show " + file);
  }
}

void MainWindow::OnAbout() {
  aboutBox_->show();
  aboutBox_->raise();
  aboutBox_->activateWindow();
}

}  // namespace quillane
