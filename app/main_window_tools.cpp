// The tool windows: opening and closing them, and what their batch panels ask of the main
// window (the shared folders, the batch file list and the Convert loop).
#include <QApplication>
#include <QListWidget>
#include <QToolButton>
#include <exception>
#include <string>

#include "app/local_path.h"
#include "app/main_window.h"
#include "batch/batch_convert.h"
#include "ui/batch_done_dialog.h"
#include "ui/platform.h"
#include "ui/tool_window.h"

namespace quillane {
namespace {

// The busy cursor while the Convert loop runs, whatever way it ends.
class BusyCursor {
 public:
  BusyCursor() { QApplication::setOverrideCursor(Qt::WaitCursor); }
  ~BusyCursor() { QApplication::restoreOverrideCursor(); }
  BusyCursor(const BusyCursor&) = delete;
  BusyCursor& operator=(const BusyCursor&) = delete;
};

}  // namespace

void MainWindow::RegisterToolWindow(ToolWindow* window) {
  const int number = window->Number();
  if (number < 1 || number >= static_cast<int>(toolWindows_.size())) return;
  toolWindows_[static_cast<std::size_t>(number)] = window;
}

ToolWindow* MainWindow::ToolWindowAt(int number) const {
  if (number < 1 || number >= static_cast<int>(toolWindows_.size())) return nullptr;
  return toolWindows_[static_cast<std::size_t>(number)];
}

void MainWindow::CloseToolWindow() {
  if (ToolWindow* open = ToolWindowAt(activeTool_)) open->close();
}

void MainWindow::OpenTool(int number) {
  CloseToolWindow();
  ToolWindow* window = ToolWindowAt(number);
  if (window == nullptr) return;
  const QRect main = frameGeometry();
  // A window that was never shown has no frame yet; its frame is taken to be as wide as ours.
  const int toolFrameWidth = window->width() + (main.width() - width());
  window->move(main.left() + main.width() - toolFrameWidth - 25, main.top() + 84);
  window->show();
  window->raise();
  window->activateWindow();
}

QIcon MainWindow::DownArrowIcon() const {
  return downArrow_->icon();
}
QIcon MainWindow::UpArrowIcon() const {
  return upArrow_->icon();
}

void MainWindow::ChooseInputFolder() {
  const std::optional<QString> folder =
      platform_.BrowseFolder("Open a directory to input pictures to convert.", inputFolder_);
  if (!folder) return;
  inputFolder_ = *folder;
  batchFileList_->clear();
  batchNotFiles_.clear();
  const BatchScan scan = ScanBatchFolderTelling(LocalPath(inputFolder_));
  if (!scan.error.empty())
    platform_.ShowMessage("Sorry", QString::fromStdString(ShownName(scan.error)));
  for (const auto& [name, reason] : scan.notFiles) batchNotFiles_.push_back({name, reason});
  // A name is any bytes: the list shows it readably and keeps the bytes themselves to load.
  for (const std::string& name : scan.files) {
    auto* item = new QListWidgetItem(QString::fromStdString(ShownName(name)), batchFileList_);
    item->setData(Qt::UserRole, QByteArray::fromStdString(name));
  }
}

void MainWindow::ChooseOutputFolder() {
  // Opens at the input folder, as the batch panels always have.
  const std::optional<QString> folder =
      platform_.BrowseFolder("Open a directory to output pictures.", inputFolder_);
  if (!folder) return;
  outputFolder_ = *folder;
}

QStringList MainWindow::BatchFiles() const {
  QStringList names;
  for (int i = 0; i < batchFileList_->count(); ++i) names << batchFileList_->item(i)->text();
  return names;
}

BatchResult MainWindow::ConvertBatchFolder(const EffectSpec& effect, const EffectParams& params,
                                           const QString& inputField, const QString& outputField,
                                           const std::function<void()>& afterEffect) {
  BatchJob job;
  job.inputFolder = TrimBlanks(LocalPath(inputField));
  job.outputFolder = TrimBlanks(LocalPath(outputField));
  for (int i = 0; i < batchFileList_->count(); ++i)
    job.files.push_back(batchFileList_->item(i)->data(Qt::UserRole).toByteArray().toStdString());
  inputFolder_ = FromLocalPath(job.inputFolder);

  BatchObserver observer;
  observer.message = [this](const std::string& caption, const std::string& text) {
    // A message box in the middle of the loop waits for the user: the usual pointer over it.
    QApplication::setOverrideCursor(Qt::ArrowCursor);
    platform_.ShowMessage(QString::fromStdString(caption), QString::fromStdString(text));
    QApplication::restoreOverrideCursor();
  };
  // The loop blocks the event loop; repaint() draws the window at once, so the user sees each
  // picture as it is loaded and converted without any input getting through meanwhile. The
  // status bar stays empty; the busy cursor says the loop runs.
  observer.progress = [this](const BatchProgress& progress) {
    switch (progress.step) {
      case BatchProgress::Step::Loaded:
        ShowLoadedPicture(false);
        repaint();
        break;
      case BatchProgress::Step::Converted:
        ShowWorkingChanged();
        repaint();
        break;
      case BatchProgress::Step::Loading:
      case BatchProgress::Step::Written:
      case BatchProgress::Step::Skipped:
        break;
    }
  };
  observer.afterEffect = [&afterEffect](const BatchProgress&, const PictureDocument&) {
    if (afterEffect) afterEffect();
  };

  BatchResult result;
  {
    const BusyCursor busy;
    try {
      result = ConvertBatch(document_, effect, params, job, observer);
    } catch (const std::exception& e) {
      result.end = BatchResult::End::Stopped;
      result.error = e.what();
    }
  }
  // A loop that stopped half-way may have loaded a picture it never showed converted.
  ShowWorkingChanged();
  // The output folder is taken from its field only once the input has been accepted.
  if (result.end != BatchResult::End::Refused) outputFolder_ = FromLocalPath(job.outputFolder);

  std::vector<BatchSkipped> skippedAll;
  if (result.end != BatchResult::End::Refused) skippedAll = batchNotFiles_;
  skippedAll.insert(skippedAll.end(), result.skipped.begin(), result.skipped.end());
  if (!skippedAll.empty()) {
    QString text = "These pictures were skipped and have no output file:";
    for (const BatchSkipped& skipped : skippedAll)
      text += "\n" + QString::fromStdString(ShownName(skipped.reason));
    platform_.ShowMessage("Sorry", text);
  }
  if (result.end == BatchResult::End::Stopped)
    platform_.ShowError(QString::fromStdString(ShownName(result.error)));
  return result;
}

void MainWindow::ShowBatchDone() {
  batchDone_->show();
  batchDone_->raise();
  batchDone_->activateWindow();
}

}  // namespace quillane
