// Colour pencil: the photograph's colours lightened towards white where the edge map is light.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& ColorPencilEffect() {
  static const EffectSpec entry{
      .toolNumber = 5,
      .menu = EffectMenu::Color,
      .menuPosition = 1,
      .menuEntry = "Color Pencil",
      .menuHandler = "Colorsketch1Click",
      .windowClass = "TColor_Sketch",
      .caption = "Color_Pencil",
      .statusText = "Color Sketch",
      .cliName = "color-pencil",
      .batchTag = "ZidovUzivid",
      .collapsedHeight = 107,
      .expandedHeight = 184,
  };
  return entry;
}

}  // namespace quillane
