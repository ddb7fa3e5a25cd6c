// Pop art: bold coloured edge lines from the kernel filter.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& PopArtEffect() {
  static const EffectSpec entry{
      .toolNumber = 8,
      .menu = EffectMenu::Color,
      .menuPosition = 3,
      .menuEntry = "Pop art",
      .menuHandler = "Popart1Click",
      .windowClass = "TFormOfFringe3",
      .caption = "Setup for Pop art",
      .statusText = "Pop art",
      .cliName = "pop-art",
      .batchTag = "Pop-art",
      .collapsedHeight = 157,
      .expandedHeight = 240,
  };
  return entry;
}

}  // namespace quillane
