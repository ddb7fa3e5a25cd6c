// The controls of one effect parameter in a tool window, built from its declaration: one
// builder per parameter kind. The window reads every parameter's value when the effect runs.
#pragma once

#include <QWidget>
#include <functional>
#include <memory>

#include "effects/params.h"

class QVBoxLayout;

namespace quillane {

class PlatformServices;

class ParamWidget {
 public:
  virtual ~ParamWidget() = default;
  // The value the controls show. ParamError when a cell holds no whole number.
  virtual EffectParams::Values Value() const = 0;
  // Shows value; the change notification runs as if the user had set it.
  virtual void SetValue(const EffectParams::Values& value) = 0;
};

// Builds param's controls into rows (nothing for a Hidden parameter) as children of window.
// changed runs whenever the user changes the value (and on SetValue).
std::unique_ptr<ParamWidget> BuildParamWidget(const ParamSpec& param, QWidget& window,
                                              QVBoxLayout& rows, PlatformServices& platform,
                                              std::function<void()> changed);

}  // namespace quillane
