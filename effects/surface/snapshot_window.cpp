#include "effects/surface/snapshot_window.h"

#include <exception>

#include "batch/batch_convert.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr const char* kForCurrent = "for-current";

}  // namespace

SnapshotWindow::SnapshotWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : ToolWindow(spec, host, parent) {}

void SnapshotWindow::FormShow() {
  ToolWindow::FormShow();
  snapshot_ = Host().Document().Working();
}

void SnapshotWindow::FormClose() {
  ToolWindow::FormClose();
  snapshot_ = TBitmap32();
}

void SnapshotWindow::ApplyClick() {
  if (!Spec().routine) return;
  EffectParams settings = Spec().Defaults();
  settings.Merge(Params());
  if (settings.GetInt(kForCurrent) == 0) {
    Apply(true);
    return;
  }
  // The document's working picture may have changed since the window was shown; the copy
  // taken then is what this effect is laid over.
  TBitmap32 result;
  try {
    result = Spec().routine({Host().Document().Source(), snapshot_, settings});
  } catch (const std::exception& e) {
    Host().Platform().ShowError(QString::fromStdString(e.what()));
    return;
  }
  Host().SetWorkingPicture(std::move(result), true);
  Host().SetStatusText(QString::fromStdString(Spec().statusText));
}

void SnapshotWindow::BeforeBatch() {
  SetParam(kForCurrent, {0});
}

void SnapshotWindow::AfterBatch(const BatchResult& result) {
  if (!result.outputs.empty()) snapshot_ = Host().Document().Working();
}

}  // namespace quillane
