// Abstract: the kernel filter with a colour gradient.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& AbstractEffect() {
  static const EffectSpec entry{
      .toolNumber = 7,
      .menu = EffectMenu::Color,
      .menuPosition = 4,
      .menuEntry = "Abstract",
      .menuHandler = "Abstract1Click",
      .windowClass = "TFormOfFringe2",
      .caption = "Setup for Abstract",
      .statusText = "Abstract art",
      .cliName = "abstract",
      .batchTag = "Abstract",
      .collapsedHeight = 157,
      .expandedHeight = 240,
  };
  return entry;
}

}  // namespace quillane
