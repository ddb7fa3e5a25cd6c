// Vuzorar: the pen drawing with every ink pixel drawn out into a short hatching stroke.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& VuzorarEffect() {
  static const EffectSpec entry{
      .toolNumber = 3,
      .menu = EffectMenu::Mono,
      .menuPosition = 3,
      .menuEntry = "Vuzorar",
      .menuHandler = "Vuzorar1Click",
      .windowClass = "TVuzorar",
      .caption = "Vuzorar",
      .statusText = "Vuzorar",
      .cliName = "vuzorar",
      .batchTag = "Vuzorar",
      .collapsedHeight = 127,
      .expandedHeight = 205,
      .colorUp = true,
  };
  return entry;
}

}  // namespace quillane
