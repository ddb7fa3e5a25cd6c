// Water colour: cycles of sharpening and median passes.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& WaterColorEffect() {
  static const EffectSpec entry{
      .toolNumber = 9,
      .menu = EffectMenu::Color,
      .menuPosition = 5,
      .menuEntry = "Water color",
      .menuHandler = "Watercolor1Click",
      .windowClass = "TWater_Color",
      .caption = "Water_Color",
      .statusText = "Water color",
      .cliName = "water-color",
      .batchTag = "WaterColor",
      .collapsedHeight = 103,
      .expandedHeight = 184,
  };
  return entry;
}

}  // namespace quillane
