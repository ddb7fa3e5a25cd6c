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

  const TBitmap32& Snapshot() const { return snapshot_; }

 public slots:
  void ApplyClick() override;

 protected:
  void FormShow() override;
  void FormClose() override;
  void BeforeBatch() override;
  void AfterBatch(const BatchResult& result) override;

 private:
  TBitmap32 snapshot_;
};

class TStria : public SnapshotWindow {
  Q_OBJECT

 public:
  using SnapshotWindow::SnapshotWindow;
};

}  // namespace quillane
