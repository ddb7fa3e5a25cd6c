// Realism: a 3 x 3 convolution with a kernel the user edits.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& RealismEffect() {
  static const EffectSpec entry{
      .toolNumber = 6,
      .menu = EffectMenu::Color,
      .menuPosition = 2,
      .menuEntry = "Realism",
      .menuHandler = "Realism1Click",
      .windowClass = "TFormOfFringe1",
      .caption = "Setup for Realism",
      .statusText = "Realism",
      .cliName = "realism",
      .batchTag = "Realism",
      .collapsedHeight = 157,
      .expandedHeight = 240,
  };
  return entry;
}

}  // namespace quillane
