// Colour panel: the picture laid out as coloured panels, panes or catercorners.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& ColorPanelEffect() {
  static const EffectSpec entry{
      .toolNumber = 13,
      .menu = EffectMenu::Adjust,
      .menuPosition = 1,
      .menuEntry = "Color panel",
      .menuHandler = "Colorpanel1Click",
      .windowClass = "TColor_Panel",
      .caption = "Color_Panel",
      .statusText = "Color Panels",
      .cliName = "color-panel",
  };
  return entry;
}

}  // namespace quillane
