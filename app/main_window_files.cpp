// Opening a picture file and saving the working picture.
#include <QFileInfo>
#include <new>
#include <optional>

#include "app/local_path.h"
#include "app/main_window.h"
#include "codecs/picture_file.h"
#include "imaging/memory_budget.h"
#include "ui/picture_view.h"
#include "ui/platform.h"

namespace quillane {
namespace {

// Pairs of displayed name and mask. Icons load through "All files" though no filter lists them.
const QString kOpenFilter =
    "*.jpg|*.jpg|*.jpeg|*.jpeg|*.bmp|*.bmp|*.wmf|*.wmf|*.emf|*.emf|*.gif|*.gif|All files|*.*";
const QString kSaveFilter = "*.jpg|*.jpg|*.bmp|*.bmp|*.wmf|*.wmf";

}  // namespace

void MainWindow::OnOpen() {
  CloseToolWindow();
  const std::optional<FileChoice> choice = platform_.OpenPictureDialog(kOpenFilter);
  if (!choice) return;
  OpenPictureFile(choice->path);
}

bool MainWindow::OpenPictureFile(const QString& path) {
  // Decoded once into a bitmap of its own: a file that cannot be read leaves the document as
  // it was.
  std::optional<Bitmap32> picture;
  try {
    picture = LoadPictureFile(
        LocalPath(path), [this](const std::string& caption, const std::string& text) {
          platform_.ShowMessage(QString::fromStdString(caption), QString::fromStdString(text));
        });
  } catch (const std::exception& e) {
    platform_.ShowError(QString::fromStdString(e.what()));
    return false;
  }
  if (!picture || picture->Empty()) {
    platform_.ShowMessage("Sorry", path + " is not a valid format");
    return false;
  }
  const int width = picture->Width(), height = picture->Height();
  try {
    ShowNewPicture(std::move(*picture), true);
  } catch (const std::bad_alloc&) {
    platform_.ShowError(path + " " +
                        QString::fromStdString(MemoryNeedText(OperationBytes(width, height))));
    return false;
  }
  RememberPendingRecent();  // one opened before, whose picture was never painted
  pendingRecent_ = path;
  FillRecentMenu();
  if (!pictureView_->isVisible()) RememberPendingRecent();
  // Until the user has saved somewhere, Save starts beside the picture on screen.
  if (!savedOnce_) saveStartFolder_ = QFileInfo(path).absolutePath();
  return true;
}

void MainWindow::OnSave() {
  const std::optional<FileChoice> choice =
      platform_.SavePictureDialog(kSaveFilter, saveStartFolder_);
  if (!choice) return;
  // From now on the dialog's own memory of where it saved last.
  savedOnce_ = true;
  saveStartFolder_.clear();
  const std::string name = LocalPath(choice->path);
  // The writers replace an existing file only once the new one is complete, so a failed save
  // keeps what was there.
  try {
    switch (choice->filterIndex) {
      case 2:
        SaveBitmap24(document_.Working(), ReplaceExtension(name, ".bmp"));
        break;
      case 3:
        SaveMetafile(document_.Working(), ReplaceExtension(name, ".wmf"));
        break;
      default:  // 1, and whatever a dialog gives that is not one of the three types
        SaveJpeg(document_.Working(), ReplaceExtension(name, ".jpg"), 90);
        break;
    }
  } catch (const std::exception& e) {
    platform_.ShowError(QString::fromStdString(e.what()));
  }
}

}  // namespace quillane
