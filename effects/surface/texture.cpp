// Texture: one of fifteen surface tiles laid over the picture.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& TextureEffect() {
  static const EffectSpec entry{
      .toolNumber = 14,
      .menu = EffectMenu::Veins,
      .menuPosition = 2,
      .menuEntry = "Texture",
      .menuHandler = "exture1Click",
      .windowClass = "TTexture",
      .caption = "Texture",
      .statusText = "Made texture",
      .cliName = "texture",
      .batchTag = "Texture",
      .collapsedHeight = 288,
      .expandedHeight = 368,
  };
  return entry;
}

}  // namespace quillane
