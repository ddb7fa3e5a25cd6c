#include "app/qt_platform.h"

#include <QApplication>
#include <QColorDialog>
#include <QDesktopServices>
#include <QFileDialog>
#include <QFileInfo>
#include <QGridLayout>
#include <QImageReader>
#include <QLabel>
#include <QMessageBox>
#include <QPrintDialog>
#include <QUrl>

namespace quillane {
namespace {

QWidget* DialogOwner() {
  return QApplication::activeWindow();
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
  if (auto* grid = qobject_cast<QGridLayout*>(dialog.layout())) {
    auto* preview = new PreviewLabel(&dialog);
    grid->addWidget(preview, 1, grid->columnCount(), 1, 1, Qt::AlignTop);
    QObject::connect(&dialog, &QFileDialog::currentChanged, preview, &PreviewLabel::ShowFile);
  }
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return std::nullopt;
  return FileChoice{dialog.selectedFiles().first(),
                    FilterIndexOf(filters, dialog.selectedNameFilter())};
}

std::optional<FileChoice> QtPlatformServices::SavePictureDialog(const QString& filter) {
  QFileDialog dialog(DialogOwner());
  dialog.setOption(QFileDialog::DontUseNativeDialog);
  dialog.setAcceptMode(QFileDialog::AcceptSave);
  dialog.setFileMode(QFileDialog::AnyFile);
  // The caller replaces the extension and overwrites without asking, as the program always has.
  dialog.setOption(QFileDialog::DontConfirmOverwrite);
  const QStringList filters = NameFiltersFromPairs(filter);
  dialog.setNameFilters(filters);
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return std::nullopt;
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
  const QColor chosen = QColorDialog::getColor(start, DialogOwner());
  if (!chosen.isValid()) return std::nullopt;
  return static_cast<std::uint32_t>(chosen.red()) |
         (static_cast<std::uint32_t>(chosen.green()) << 8) |
         (static_cast<std::uint32_t>(chosen.blue()) << 16);
}

void QtPlatformServices::OpenFolder(const QString& folder) {
  QDesktopServices::openUrl(QUrl::fromLocalFile(folder));
}

bool QtPlatformServices::PrintDialog(QPrinter& printer) {
  QPrintDialog dialog(&printer, DialogOwner());
  return dialog.exec() == QDialog::Accepted;
}

bool QtPlatformServices::OpenWithDefaultProgram(const QString& path) {
  return QDesktopServices::openUrl(QUrl::fromLocalFile(path));
}

}  // namespace quillane
