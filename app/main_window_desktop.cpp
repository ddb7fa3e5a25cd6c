// What the main window adds to its menus to behave as desktop programs do: the standard
// shortcuts, Alt-letter access to the menus, File > Open Recent, and pictures dropped on the
// window. The captions the menus show stay as they are.
#include <QAction>
#include <QDragEnterEvent>
#include <QDropEvent>
#include <QFileInfo>
#include <QKeySequence>
#include <QMenu>
#include <QMenuBar>
#include <QMimeData>
#include <QSettings>
#include <QToolButton>
#include <QUrl>
#include <iterator>
#include <utility>

#include "app/main_window.h"
#include "app/settings.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr int kRecentCount = 10;
const QString kRecentKey = QStringLiteral("recentPictures");

QStringList StoredRecent() {
  return ProgramSettings().value(kRecentKey).toStringList();
}

void StoreRecent(const QStringList& files) {
  QSettings settings = ProgramSettings();
  settings.setValue(kRecentKey, files);
}

// caption with "&" before its first letter letter that is not itself part of a "&&".
QString WithAccelerator(const QString& caption, QChar letter) {
  for (qsizetype i = 0; i < caption.size(); ++i) {
    if (caption[i] == '&') {
      ++i;  // "&&" shows one "&"
      continue;
    }
    if (caption[i] == letter) return caption.left(i) + '&' + caption.mid(i);
  }
  return caption;
}

// The single local file a drag carries; empty for anything else.
QString DraggedFile(const QMimeData* data) {
  if (data == nullptr || !data->hasUrls() || data->urls().size() != 1) return {};
  const QUrl url = data->urls().first();
  return url.isLocalFile() ? url.toLocalFile() : QString();
}

}  // namespace

void MainWindow::AddDesktopActions() {
  struct Accelerator {
    const char* menu;
    char letter;
  };
  // Color and ColorAdjust both start with C; V is View's, as everywhere on the desktop (its
  // menu comes later, with its letter in its caption), and Edit has the e of Veins.
  static const Accelerator kMenus[] = {{"File1", 'F'},  {"Edit1", 'E'},        {"BW1", 'B'},
                                       {"Color1", 'C'}, {"ColorAdjust1", 'A'}, {"Veins1", 'i'},
                                       {"Help1", 'H'}};
  for (const Accelerator& a : kMenus)
    if (auto* menu = menuBar()->findChild<QMenu*>(a.menu))
      menu->setTitle(WithAccelerator(menu->title(), QChar(a.letter)));

  // The desktop's own keys for each; the usual ones where its key scheme has none (a scheme may
  // leave out Quit, for one).
  struct Shortcut {
    const char* action;
    QKeySequence::StandardKey key;
    QKeyCombination usual;
  };
  static const Shortcut kShortcuts[] = {
      {"Open1", QKeySequence::Open, Qt::CTRL | Qt::Key_O},
      {"Save1", QKeySequence::Save, Qt::CTRL | Qt::Key_S},
      {"Undo1", QKeySequence::Undo, Qt::CTRL | Qt::Key_Z},
      {"Redo1", QKeySequence::Redo, Qt::CTRL | Qt::SHIFT | Qt::Key_Z},
      {"Exit1", QKeySequence::Quit, Qt::CTRL | Qt::Key_Q},
      {"PrintShortcut", QKeySequence::Print, Qt::CTRL | Qt::Key_P}};
  // Print has a toolbar button but no menu entry; its shortcut presses the button.
  auto* print = new QAction("Print", this);
  print->setObjectName("PrintShortcut");
  addAction(print);
  connect(print, &QAction::triggered, this, [this] {
    if (auto* button = centralWidget()->findChild<QToolButton*>("SpeedButton10")) button->click();
  });
  for (const Shortcut& s : kShortcuts) {
    auto* action = findChild<QAction*>(s.action);
    if (action == nullptr) continue;
    QList<QKeySequence> keys = QKeySequence::keyBindings(s.key);
    if (keys.isEmpty()) keys = {QKeySequence(s.usual)};
    action->setShortcuts(keys);
  }

  QMenu* file = menuBar()->findChild<QMenu*>("File1");
  QAction* save = menuBar()->findChild<QAction*>("Save1");
  if (file == nullptr || save == nullptr) return;
  recentMenu_ = new QMenu("Open &Recent", file);
  recentMenu_->setObjectName("OpenRecent1");
  recentMenu_->setToolTipsVisible(true);
  file->insertMenu(save, recentMenu_);
  connect(recentMenu_, &QMenu::aboutToShow, this, &MainWindow::FillRecentMenu);
  FillRecentMenu();

  setAcceptDrops(true);
}

namespace {

QStringList WithRecent(QStringList files, const QString& path) {
  const QString full = QFileInfo(path).absoluteFilePath();
  files.removeAll(full);
  files.prepend(full);
  while (files.size() > kRecentCount) files.removeLast();
  return files;
}

}  // namespace

QStringList MainWindow::RecentFiles() const {
  const QStringList files = StoredRecent();
  return pendingRecent_.isEmpty() ? files : WithRecent(files, pendingRecent_);
}

void MainWindow::RememberRecent(const QString& path) {
  pendingRecent_.clear();
  StoreRecent(WithRecent(StoredRecent(), path));
  FillRecentMenu();
}

void MainWindow::RememberPendingRecent() {
  if (pendingRecent_.isEmpty()) return;
  const QString path = std::exchange(pendingRecent_, QString());
  RememberRecent(path);
}

void MainWindow::FillRecentMenu() {
  if (recentMenu_ == nullptr) return;
  recentMenu_->clear();
  const QStringList files = RecentFiles();
  int number = 0;
  for (const QString& path : files) {
    ++number;
    const QString name = QFileInfo(path).fileName().replace('&', "&&");
    QAction* entry =
        recentMenu_->addAction(number < 10 ? QStringLiteral("&%1 %2").arg(number).arg(name) : name);
    entry->setToolTip(path);
    entry->setData(path);
    connect(entry, &QAction::triggered, this, [this, path] { OpenRecentFile(path); });
  }
  recentMenu_->setEnabled(!files.isEmpty());
}

void MainWindow::OpenRecentFile(const QString& path) {
  RememberPendingRecent();
  if (!QFileInfo(path).isFile()) {
    QStringList files = StoredRecent();
    files.removeAll(path);
    StoreRecent(files);
    FillRecentMenu();
    platform_.ShowMessage("Sorry", path + " no longer exists; it was taken off the recent list.");
    return;
  }
  CloseToolWindow();
  OpenPictureFile(path);
}

void MainWindow::dragEnterEvent(QDragEnterEvent* event) {
  if (!DraggedFile(event->mimeData()).isEmpty())
    event->acceptProposedAction();
  else
    event->ignore();
}

void MainWindow::dropEvent(QDropEvent* event) {
  const QString path = DraggedFile(event->mimeData());
  if (path.isEmpty()) {
    event->ignore();
    return;
  }
  event->acceptProposedAction();
  // As File > Open does: the open tool window closes first.
  CloseToolWindow();
  OpenPictureFile(path);
}

}  // namespace quillane
