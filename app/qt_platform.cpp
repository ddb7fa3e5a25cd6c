#include "app/qt_platform.h"

#include <QApplication>
#include <QColorDialog>
#include <QDesktopServices>
#include <QFileDialog>
#include <QFileInfo>
#include <QFileSystemModel>
#include <QGridLayout>
#include <QHeaderView>
#include <QImageReader>
#include <QLabel>
#include <QMainWindow>
#include <QMessageBox>
#include <QPrintDialog>
#include <QProcess>
#include <QScreen>
#include <QStandardPaths>
#include <QTimer>
#include <QTreeView>
#include <QUrl>
#include <algorithm>

#include "app/settings.h"

namespace quillane {
namespace {

const QString kOpenFolderKey = QStringLiteral("dialogs/openFolder");
const QString kSaveFolderKey = QStringLiteral("dialogs/saveFolder");

// A message box or dialog belongs to the window the user is working in (a tool window when its
// button raised it), so it is centred on that window and kept above it; with no window active
// (at start-up, or while another program has the focus) it belongs to the main window.
QWidget* DialogOwner() {
  if (QWidget* modal = QApplication::activeModalWidget()) return modal;
  if (QWidget* active = QApplication::activeWindow()) return active;
  for (QWidget* top : QApplication::topLevelWidgets())
    if (qobject_cast<QMainWindow*>(top) != nullptr && top->isVisible()) return top;
  return nullptr;
}

// Each picture dialog opens in the folder it was last used in, remembered between runs; the
// first time in the user's pictures folder, or at home.
void StartInRememberedFolder(QFileDialog& dialog, const QString& key) {
  QString folder = ProgramSettings().value(key).toString();
  if (folder.isEmpty() || !QFileInfo(folder).isDir())
    folder = QStandardPaths::writableLocation(QStandardPaths::PicturesLocation);
  if (folder.isEmpty() || !QFileInfo(folder).isDir()) folder = QDir::homePath();
  dialog.setDirectory(folder);
}

void RememberFolder(const QFileDialog& dialog, const QString& key) {
  QSettings settings = ProgramSettings();
  settings.setValue(key, dialog.directory().absolutePath());
}

// Size, type and date as wide as their titles and the entries shown need (they only grow, so
// a width the user chose stays while it fits), and the name column the rest of the list, with
// the dialog widened where the list is too narrow for that.
void FitColumns(QFileDialog& dialog, QTreeView& view) {
  QHeaderView* header = view.header();
  if (header->count() < 2) return;
  const QAbstractItemView& entries = view;  // where the entries' widths are public
  int others = 0;
  for (int i = 1; i < header->count(); ++i) {
    const int needed = std::max(header->sectionSizeHint(i), entries.sizeHintForColumn(i));
    header->resizeSection(i, std::max(header->sectionSize(i), needed));
    others += header->sectionSize(i);
  }
  // Room for a name of about thirty characters.
  const int name = std::max(header->sectionSizeHint(0), view.fontMetrics().averageCharWidth() * 30);
  const int missing = name + others - view.viewport()->width();
  if (missing > 0 && dialog.isVisible()) {
    const QRect screen = dialog.screen()->availableGeometry();
    dialog.resize(std::min(dialog.width() + missing, screen.width()), dialog.height());
  }
  header->resizeSection(0, std::max(name, view.viewport()->width() - others));
}

// The file list in details, every column wide enough for its title and its entries.
void ShowWholeColumns(QFileDialog& dialog) {
  dialog.setViewMode(QFileDialog::Detail);
  dialog.resize(dialog.size().expandedTo(QSize(860, 500)));
  auto* view = dialog.findChild<QTreeView*>("treeView");
  auto* model = dialog.findChild<QFileSystemModel*>();
  if (view == nullptr || model == nullptr) return;
  // The entries are read on a thread of the model's own: fitted once the dialog is up, and
  // again as each folder has been read.
  const auto fit = [&dialog, view] { FitColumns(dialog, *view); };
  QObject::connect(model, &QFileSystemModel::directoryLoaded, view, fit, Qt::QueuedConnection);
  QTimer::singleShot(0, view, fit);
}

// The open dialog shows a small preview of the file under the cursor, as the picture dialogs of
// the desktop the program comes from do.
class PreviewLabel : public QLabel {
 public:
  explicit PreviewLabel(QWidget* parent) : QLabel(parent) {
    setFixedSize(kSide + 8, kSide + 8);
    setAlignment(Qt::AlignCenter);
    setFrameShape(QFrame::StyledPanel);
    setText(tr("(None)"));
  }

  void ShowFile(const QString& path) {
    QImageReader reader(path);
    const QSize size = reader.size();
    if (!QFileInfo(path).isFile() || !size.isValid() || size.isEmpty()) {
      clear();
      setText(tr("(None)"));
      return;
    }
    // Decoding at the preview size keeps a huge photo from being read in full.
    reader.setScaledSize(size.scaled(kSide, kSide, Qt::KeepAspectRatio).expandedTo(QSize(1, 1)));
    const QImage image = reader.read();
    if (image.isNull()) {
      clear();
      setText(tr("(None)"));
      return;
    }
    setPixmap(QPixmap::fromImage(image));
  }

 private:
  static constexpr int kSide = 160;
};

int FilterIndexOf(const QStringList& filters, const QString& selected) {
  const int i = static_cast<int>(filters.indexOf(selected));
  return i < 0 ? 1 : i + 1;
}

}  // namespace

QStringList NameFiltersFromPairs(const QString& filter) {
  const QStringList parts = filter.split('|');
  QStringList result;
  for (int i = 0; i + 1 < parts.size(); i += 2) {
    const QString& name = parts[i];
    QString mask = parts[i + 1];
    mask.replace("*.*", "*");
    mask.replace(';', ' ');
    if (name == parts[i + 1] && name == mask)
      result << mask;
    else
      result << QStringLiteral("%1 (%2)").arg(name, mask);
  }
  return result;
}

void QtPlatformServices::ShowMessage(const QString& caption, const QString& text) {
  QMessageBox box(QMessageBox::NoIcon, caption, text, QMessageBox::Ok, DialogOwner());
  box.exec();
}

void QtPlatformServices::ShowError(const QString& text) {
  QMessageBox box(QMessageBox::Critical, QApplication::applicationName(), text, QMessageBox::Ok,
                  DialogOwner());
  box.exec();
}

std::optional<FileChoice> QtPlatformServices::OpenPictureDialog(const QString& filter) {
  QFileDialog dialog(DialogOwner());
  dialog.setOption(QFileDialog::DontUseNativeDialog);
  dialog.setAcceptMode(QFileDialog::AcceptOpen);
  dialog.setFileMode(QFileDialog::ExistingFile);
  const QStringList filters = NameFiltersFromPairs(filter);
  dialog.setNameFilters(filters);
  StartInRememberedFolder(dialog, kOpenFolderKey);
  ShowWholeColumns(dialog);
  if (auto* grid = qobject_cast<QGridLayout*>(dialog.layout())) {
    auto* preview = new PreviewLabel(&dialog);
    grid->addWidget(preview, 1, grid->columnCount(), 1, 1, Qt::AlignTop);
    QObject::connect(&dialog, &QFileDialog::currentChanged, preview, &PreviewLabel::ShowFile);
  }
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return std::nullopt;
  RememberFolder(dialog, kOpenFolderKey);
  return FileChoice{dialog.selectedFiles().first(),
                    FilterIndexOf(filters, dialog.selectedNameFilter())};
}

std::optional<FileChoice> QtPlatformServices::SavePictureDialog(const QString& filter,
                                                                const QString& startFolder) {
  QFileDialog dialog(DialogOwner());
  dialog.setOption(QFileDialog::DontUseNativeDialog);
  dialog.setAcceptMode(QFileDialog::AcceptSave);
  dialog.setFileMode(QFileDialog::AnyFile);
  // The caller replaces the extension and overwrites without asking, as the program always has.
  dialog.setOption(QFileDialog::DontConfirmOverwrite);
  const QStringList filters = NameFiltersFromPairs(filter);
  dialog.setNameFilters(filters);
  if (!startFolder.isEmpty() && QFileInfo(startFolder).isDir())
    dialog.setDirectory(startFolder);
  else
    StartInRememberedFolder(dialog, kSaveFolderKey);
  ShowWholeColumns(dialog);
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return std::nullopt;
  RememberFolder(dialog, kSaveFolderKey);
  return FileChoice{dialog.selectedFiles().first(),
                    FilterIndexOf(filters, dialog.selectedNameFilter())};
}

std::optional<QString> QtPlatformServices::BrowseFolder(const QString& title,
                                                        const QString& startFolder) {
  const QString folder = QFileDialog::getExistingDirectory(
      DialogOwner(), title, startFolder,
      QFileDialog::ShowDirsOnly | QFileDialog::DontUseNativeDialog);
  if (folder.isEmpty()) return std::nullopt;
  return folder;
}

std::optional<std::uint32_t> QtPlatformServices::ChooseColor(std::uint32_t initial) {
  const QColor start(static_cast<int>(initial & 0xFF), static_cast<int>((initial >> 8) & 0xFF),
                     static_cast<int>((initial >> 16) & 0xFF));
  // The toolkit's own dialog, whose custom colours are always shown; a desktop's portal dialog
  // (GNOME's) opens without them.
  const QColor chosen =
      QColorDialog::getColor(start, DialogOwner(), QString(), QColorDialog::DontUseNativeDialog);
  if (!chosen.isValid()) return std::nullopt;
  return static_cast<std::uint32_t>(chosen.red()) |
         (static_cast<std::uint32_t>(chosen.green()) << 8) |
         (static_cast<std::uint32_t>(chosen.blue()) << 16);
}

bool QtPlatformServices::OpenFolder(const QString& folder) {
  const QString opener = QStandardPaths::findExecutable("xdg-open");
  if (opener.isEmpty()) return QDesktopServices::openUrl(QUrl::fromLocalFile(folder));
  // xdg-open answers at once when the desktop has a file manager to hand the folder to, and
  // fails when it finds none. Without a desktop it may run the file manager itself until that
  // closes: still running after a moment means it did start one, and it is left running.
  auto* process = new QProcess;
  process->setProgram(opener);
  process->setArguments({folder});
  process->setStandardOutputFile(QProcess::nullDevice());
  process->setStandardErrorFile(QProcess::nullDevice());
  QObject::connect(process, &QProcess::finished, process, &QObject::deleteLater);
  process->start();
  if (!process->waitForStarted()) {
    delete process;
    return false;
  }
  constexpr int kAnswerMilliseconds = 3000;
  if (!process->waitForFinished(kAnswerMilliseconds)) return true;
  return process->exitStatus() == QProcess::NormalExit && process->exitCode() == 0;
}

bool QtPlatformServices::PrintDialog(QPrinter& printer) {
  QPrintDialog dialog(&printer, DialogOwner());
  return dialog.exec() == QDialog::Accepted;
}

bool QtPlatformServices::OpenWithDefaultProgram(const QString& path) {
  return QDesktopServices::openUrl(QUrl::fromLocalFile(path));
}

}  // namespace quillane
