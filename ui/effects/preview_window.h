// The colour filter and colour variety windows: the picture and a full-size preview shown side
// by side as thumbnails, colour swatches that change the preview at once, "For current" and OK,
// which makes the preview the working picture and closes the window. A click on the left
// thumbnail ("Reset") puts the preview back to the unchanged picture.
#pragma once

#include "ui/tool_window.h"

namespace quillane {

class PictureView;

class PreviewWindow : public ToolWindow {
  Q_OBJECT

 public:
  PreviewWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

  const Bitmap32& Base() const { return base_; }
  const Bitmap32& Preview() const { return preview_; }

 public slots:
  void OnApply() override;
  void ShowBase();

 public:
  void setVisible(bool visible) override;

 protected:
  void OnShown() override;
  void ControlChanged(const ParamSpec& param) override;
  // The swatches' own way back to "nothing chosen".
  virtual void ClearSwatches() = 0;
  void SetPreview(Bitmap32 preview);

 private:
  // Base and preview become a copy of the source, or of the working picture for "For current".
  void LoadBase();

  Bitmap32 base_;
  Bitmap32 preview_;
  PictureView* baseView_ = nullptr;
  PictureView* previewView_ = nullptr;
};

class ColorFilterWindow : public PreviewWindow {
  Q_OBJECT

 public:
  ColorFilterWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

 protected:
  void ControlChanged(const ParamSpec& param) override;
  void ClearSwatches() override;
};

class ColorVarietyWindow : public PreviewWindow {
  Q_OBJECT

 public:
  ColorVarietyWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

 protected:
  void ControlChanged(const ParamSpec& param) override;
  void ClearSwatches() override;
};

}  // namespace quillane
