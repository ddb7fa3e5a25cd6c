// The document's actions: effects and results written into the working picture, the history
// step, Undo, Redo and Renew, and the status line.
#include <QAction>
#include <QApplication>
#include <QEventLoop>
#include <QLabel>
#include <QScrollArea>
#include <QScrollBar>
#include <QToolButton>
#include <chrono>
#include <exception>
#include <new>
#include <string>
#include <thread>

#include "app/main_window.h"
#include "document/run_effect.h"
#include "imaging/memory_budget.h"
#include "ui/picture_view.h"
#include "ui/platform.h"

namespace quillane {

void MainWindow::ShowNewPicture(Bitmap32 picture, bool resetHistory) {
  HoldBackgroundUntilShown();
  document_.Load(std::move(picture));
  ShowLoadedPicture(resetHistory);
}

void MainWindow::ShowLoadedPicture(bool resetHistory) {
  if (resetHistory) document_.ResetHistory();
  ShowWorking(zoomPercent_);
  scrollBox_->horizontalScrollBar()->setValue(0);
  scrollBox_->verticalScrollBar()->setValue(0);
  UpdateHistoryControls();
}

namespace {

// Swallows what the user does with mouse, keys and window close boxes while an effect runs;
// painting, moving and resizing the windows go on.
class IgnoreInput : public QObject {
 public:
  IgnoreInput() { QCoreApplication::instance()->installEventFilter(this); }
  ~IgnoreInput() override { QCoreApplication::instance()->removeEventFilter(this); }

 protected:
  bool eventFilter(QObject*, QEvent* event) override {
    switch (event->type()) {
      case QEvent::MouseButtonPress:
      case QEvent::MouseButtonRelease:
      case QEvent::MouseButtonDblClick:
      case QEvent::Wheel:
      case QEvent::KeyPress:
      case QEvent::KeyRelease:
      case QEvent::ShortcutOverride:
      case QEvent::Shortcut:
      case QEvent::ContextMenu:
      case QEvent::TouchBegin:
      case QEvent::TouchUpdate:
      case QEvent::TouchEnd:
      case QEvent::Close:
        return event->spontaneous();
      default:
        return false;
    }
  }
};

}  // namespace

void MainWindow::RunWhileWindowsWait(const std::function<void()>& work) {
  effectRunning_ = true;
  QApplication::setOverrideCursor(Qt::WaitCursor);
  {
    const IgnoreInput ignoreInput;
    QEventLoop loop;
    std::thread worker([&work, &loop] {
      work();
      QMetaObject::invokeMethod(&loop, &QEventLoop::quit, Qt::QueuedConnection);
    });
    loop.exec();
    worker.join();
  }
  QApplication::restoreOverrideCursor();
  effectRunning_ = false;
}

bool MainWindow::ApplyEffect(const EffectSpec& effect, const EffectParams& params,
                             bool recordHistory) {
  // The picture a second apply would start from is still being made.
  if (effectRunning_) return false;
  try {
    // The routine runs apart from the document and lands on it only once it is done, so the
    // windows can be painted meanwhile and nothing ever sees a half-made picture.
    EffectRun run(document_, effect, params);
    std::exception_ptr failure;
    RunWhileWindowsWait([&run, &failure] {
      try {
        run.Compute();
      } catch (...) {
        failure = std::current_exception();
      }
    });
    if (failure) std::rethrow_exception(failure);
    HoldBackgroundUntilShown();
    run.Land(document_, recordHistory);
  } catch (const std::bad_alloc&) {
    const Bitmap32& source = document_.Source();
    platform_.ShowError(QString::fromStdString(
        effect.statusText + " on the picture of " + std::to_string(source.Width()) + " by " +
        std::to_string(source.Height()) + " pixels " +
        MemoryNeedText(OperationBytes(source.Width(), source.Height()))));
    return false;
  } catch (const std::exception& e) {
    platform_.ShowError(QString::fromStdString(e.what()));
    return false;
  } catch (...) {
    platform_.ShowError("The effect failed.");
    return false;
  }
  ShowWorkingChanged();
  SetStatusText(QString::fromStdString(effect.statusText));
  return true;
}

void MainWindow::SetWorkingPicture(Bitmap32 picture, bool recordHistory) {
  HoldBackgroundUntilShown();
  document_.SetWorking(std::move(picture));
  if (recordHistory) document_.Backup();
  ShowWorkingChanged();
}

void MainWindow::ShowWorkingChanged() {
  ShowWorking(zoomPercent_);
  UpdateHistoryControls();
}

void MainWindow::RecordHistoryStep() {
  document_.Backup();
  UpdateHistoryControls();
}

void MainWindow::UpdateHistoryControls() {
  undoButton_->setEnabled(document_.CanUndo());
  undoAction_->setEnabled(document_.CanUndo());
  redoButton_->setEnabled(document_.CanRedo());
  redoAction_->setEnabled(document_.CanRedo());
}

void MainWindow::HoldBackgroundUntilShown() {
  // A control that is not on screen is not painted; the hold then simply runs out.
  constexpr std::chrono::milliseconds kLongestHold(250);
  if (pictureView_->isVisible()) PictureDocument::HoldBackgroundWork(kLongestHold);
}

void MainWindow::OnUndo() {
  HoldBackgroundUntilShown();
  if (document_.Undo()) {
    ShowWorking(ZoomFromLabel());
    SetStatusText("Undo");
  }
  UpdateHistoryControls();
}

void MainWindow::OnRedo() {
  HoldBackgroundUntilShown();
  if (document_.Redo()) {
    ShowWorking(ZoomFromLabel());
    SetStatusText("Redo");
  }
  UpdateHistoryControls();
}

void MainWindow::OnRenew() {
  HoldBackgroundUntilShown();
  document_.Renew();
  ShowWorking(zoomPercent_);
  scrollBox_->horizontalScrollBar()->setValue(0);
  scrollBox_->verticalScrollBar()->setValue(0);
  UpdateHistoryControls();
}

QString MainWindow::StatusText() const {
  return statusLine_->text();
}

void MainWindow::SetStatusText(const QString& text) {
  statusLine_->setText(text);
  statusLine_->adjustSize();
}

}  // namespace quillane
