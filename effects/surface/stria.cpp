// Stria: vertical or horizontal stripes laid over the picture.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& StriaEffect() {
  static const EffectSpec entry{
      .toolNumber = 17,
      .menu = EffectMenu::Veins,
      .menuPosition = 3,
      .menuEntry = "Stria",
      .menuHandler = "Verticalstria1Click",
      .windowClass = "TStria",
      .caption = "Stria",
      .statusText = "Added stria",
      .cliName = "stria",
      .batchTag = "Stria",
      .collapsedHeight = 159,
      .expandedHeight = 240,
  };
  return entry;
}

}  // namespace quillane
