// Emboss: a gray relief from each pixel against its neighbour down and to the right.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& EmbossEffect() {
  static const EffectSpec entry{
      .toolNumber = 15,
      .menu = EffectMenu::Veins,
      .menuPosition = 1,
      .menuEntry = "Emboss",
      .menuHandler = "Emboss1Click",
      .windowClass = "TEmboss",
      .caption = "Emboss",
      .statusText = "Emboss",
      .cliName = "emboss",
      .batchTag = "Emboss",
      .collapsedHeight = 103,
      .expandedHeight = 184,
  };
  return entry;
}

}  // namespace quillane
