// The windows whose effect can be laid over the picture as shown ("For current"): they keep a
// copy of the working picture taken when they are shown, so that pressing OK again starts from
// that copy instead of piling effect on effect. Batch conversion clears "For current", so each
// picture is taken from its own source, and afterwards the copy becomes the last result.
#pragma once

#include "ui/tool_window.h"

namespace quillane {

class SnapshotWindow : public ToolWindow {
  Q_OBJECT

 public:
  // The effect's parameters include the "for-current" switch.
  SnapshotWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

  const Bitmap32& Snapshot() const { return snapshot_; }

 public slots:
  void OnApply() override;

 protected:
  void OnShown() override;
  void OnClosed() override;
  void BeforeBatch() override;
  void AfterBatch(const BatchResult& result) override;

 private:
  Bitmap32 snapshot_;
};

class StriaWindow : public SnapshotWindow {
  Q_OBJECT

 public:
  using SnapshotWindow::SnapshotWindow;
};

}  // namespace quillane
