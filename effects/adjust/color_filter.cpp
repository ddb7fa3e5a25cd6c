// Colour filter: a gray picture seen through a strong colour filter.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& ColorFilterEffect() {
  static const EffectSpec entry{
      .toolNumber = 16,
      .menu = EffectMenu::Adjust,
      .menuPosition = 3,
      .menuEntry = "Color Filter",
      .menuHandler = "ColorFilter2Click",
      .windowClass = "TColor_Filter",
      .caption = "Color_Filter",
      .statusText = "Color Filter",
      .cliName = "color-filter",
  };
  return entry;
}

}  // namespace quillane
