// Colour variety: colour balance shifted step by step by swatch clicks.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& ColorVarietyEffect() {
  static const EffectSpec entry{
      .toolNumber = 12,
      .menu = EffectMenu::Adjust,
      .menuPosition = 4,
      .menuEntry = "Color variety",
      .menuHandler = "Colorvariety1Click",
      .windowClass = "TColor_variety",
      .caption = "Color_variety",
      .statusText = "Color Varied",
      .cliName = "color-variety",
  };
  return entry;
}

}  // namespace quillane
