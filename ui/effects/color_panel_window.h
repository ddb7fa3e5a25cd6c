// The colour panel window: six layout buttons in two columns and no OK; a button applies its
// layout when it becomes selected, and the selection stays while the window is hidden.
#pragma once

#include "ui/tool_window.h"

namespace quillane {

class ColorPanelWindow : public ToolWindow {
  Q_OBJECT

 public:
  ColorPanelWindow(const EffectSpec& spec, ToolHost& host, QWidget* parent);

 protected:
  void ControlChanged(const ParamSpec& param) override;
};

}  // namespace quillane
