// The "For current" check box that Stria and Texture share: whether the effect starts from the
// picture as shown when the window opened (the working picture) or from the source picture.
#pragma once

#include <string>
#include <utility>

#include "effects/registry.h"

namespace quillane {

inline ParamSpec ForCurrentParam(std::string help) {
  return {.kind = ParamKind::Switch,
          .name = "for-current",
          .objectName = "CheckBox1",
          .caption = "For current",
          .maximum = 1,
          .defaultValue = 1,
          .help = std::move(help),
          .resetOnShow = true};
}

// The picture the effect starts from, as the check box says.
inline const Bitmap32& ForCurrentBase(const EffectInput& in) {
  return in.params.GetInt("for-current") != 0 ? in.working : in.source;
}

}  // namespace quillane
