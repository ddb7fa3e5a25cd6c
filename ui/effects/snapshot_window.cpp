#include "ui/effects/snapshot_window.h"

#include <exception>

#include "batch/batch_convert.h"
#include "ui/platform.h"

namespace quillane {
namespace {

constexpr const char* kForCurrent = "for-current";

}  // namespace

SnapshotWindow::SnapshotWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent)
    : ToolWindow(spec, host, parent) {}

void SnapshotWindow::OnShown() {
  ToolWindow::OnShown();
  snapshot_ = Host().Document().Working();
}

void SnapshotWindow::OnClosed() {
  ToolWindow::OnClosed();
  snapshot_ = Bitmap32();
}

void SnapshotWindow::OnApply() {
  if (!Spec().routine) return;
  EffectParams settings = Spec().Defaults();
  settings.Merge(Params());
  if (settings.GetInt(kForCurrent) == 0) {
    Apply(true);
    return;
  }
  // The document's working picture may have changed since the window was shown; the copy
  // taken then is what this effect is laid over.
  Bitmap32 result;
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
