// Brume: every pixel takes the colour of a randomly chosen pixel near it.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& BrumeEffect() {
  static const EffectSpec entry{
      .toolNumber = 10,
      .menu = EffectMenu::Color,
      .menuPosition = 6,
      .menuEntry = "Brume",
      .menuHandler = "Brume1Click",
      .windowClass = "TBrume",
      .caption = "Brume",
      .statusText = "Brume",
      .cliName = "brume",
      .batchTag = "Brume",
      .collapsedHeight = 103,
      .expandedHeight = 184,
  };
  return entry;
}

}  // namespace quillane
