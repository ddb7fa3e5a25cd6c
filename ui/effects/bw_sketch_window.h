// The pencil sketch window: two sliders, of which the one moved last chooses the tone
// adjustment; its labels are drawn in the window-text colour and the other slider's in gray.
#pragma once

#include "effects/mono/bw_sketch.h"
#include "ui/tool_window.h"

namespace quillane {

class BwSketchWindow : public ToolWindow {
  Q_OBJECT

 public:
  BwSketchWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

  PencilToneMode ToneMode() const;

 protected:
  void OnShown() override;
  void ControlChanged(const ParamSpec& param) override;

 private:
  // Label1 and Label4 for Contrast, Label2 and Label3 for Lighting: the chosen pair in the
  // window-text colour, the other in gray.
  void MarkToneMode(PencilToneMode mode);
};

}  // namespace quillane
