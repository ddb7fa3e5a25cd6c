// The document's actions: effects and results written into the working picture, the history
// step, Undo, Redo and Renew, and the status line.
#include <QAction>
#include <QLabel>
#include <QScrollArea>
#include <QScrollBar>
#include <QToolButton>
#include <exception>
#include <new>
#include <string>

#include "app/main_window.h"
#include "document/run_effect.h"
#include "imaging/memory_budget.h"
#include "ui/platform.h"

namespace quillane {

void TMyPicture::ShowNewPicture(TBitmap32 picture, bool resetHistory) {
  document_.Load(std::move(picture));
  ShowLoadedPicture(resetHistory);
}

void TMyPicture::ShowLoadedPicture(bool resetHistory) {
  if (resetHistory) document_.ResetHistory();
  ShowWorking(zoomPercent_);
  scrollBox_->horizontalScrollBar()->setValue(0);
  scrollBox_->verticalScrollBar()->setValue(0);
  UpdateHistoryControls();
}

bool TMyPicture::ApplyEffect(const EffectSpec& effect, const EffectParams& params,
                             bool recordHistory) {
  try {
    RunEffect(document_, effect, params, recordHistory);
  } catch (const std::bad_alloc&) {
    const TBitmap32& source = document_.Source();
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

void TMyPicture::SetWorkingPicture(TBitmap32 picture, bool recordHistory) {
  document_.SetWorking(std::move(picture));
  if (recordHistory) document_.Backup();
  ShowWorkingChanged();
}

void TMyPicture::ShowWorkingChanged() {
  ShowWorking(zoomPercent_);
  UpdateHistoryControls();
}

void TMyPicture::backup() {
  document_.Backup();
  UpdateHistoryControls();
}

void TMyPicture::UpdateHistoryControls() {
  undoButton_->setEnabled(document_.CanUndo());
  undoAction_->setEnabled(document_.CanUndo());
  redoButton_->setEnabled(document_.CanRedo());
  redoAction_->setEnabled(document_.CanRedo());
}

void TMyPicture::SpeedButton3Click() {
  if (document_.Undo()) {
    ShowWorking(ZoomFromLabel());
    SetStatusText("Undo");
  }
  UpdateHistoryControls();
}

void TMyPicture::SpeedButton18Click() {
  if (document_.Redo()) {
    ShowWorking(ZoomFromLabel());
    SetStatusText("Redo");
  }
  UpdateHistoryControls();
}

void TMyPicture::SpeedButton7Click() {
  document_.Renew();
  ShowWorking(zoomPercent_);
  scrollBox_->horizontalScrollBar()->setValue(0);
  scrollBox_->verticalScrollBar()->setValue(0);
  UpdateHistoryControls();
}

QString TMyPicture::StatusText() const {
  return statusLine_->text();
}

void TMyPicture::SetStatusText(const QString& text) {
  statusLine_->setText(text);
  statusLine_->adjustSize();
}

}  // namespace quillane
