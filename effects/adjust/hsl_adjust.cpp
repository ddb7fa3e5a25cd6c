// HSL adjust: hue, saturation and lightness shifted by fixed amounts.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& HslAdjustEffect() {
  static const EffectSpec entry{
      .toolNumber = 11,
      .menu = EffectMenu::Adjust,
      .menuPosition = 2,
      .menuEntry = "HSL adjust",
      .menuHandler = "HSLadjust1Click",
      .windowClass = "THSL_Adjust",
      .caption = "HSL_Adjust",
      .statusText = "HSL Adjusted",
      .cliName = "hsl-adjust",
  };
  return entry;
}

}  // namespace quillane
