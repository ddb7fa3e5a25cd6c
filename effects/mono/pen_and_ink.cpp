// Pen and ink: the outlines of the dark areas of the photograph.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& PenAndInkEffect() {
  static const EffectSpec entry{
      .toolNumber = 4,
      .menu = EffectMenu::Mono,
      .menuPosition = 4,
      .menuEntry = "Pen && Ink",
      .menuHandler = "PenInk1Click",
      .windowClass = "TPen_and_Ink",
      .caption = "Pen_and_Ink",
      .statusText = "Pen and Ink",
      .cliName = "pen-and-ink",
      .batchTag = "Pen_and_Ink",
      .collapsedHeight = 109,
      .expandedHeight = 186,
      .colorUp = true,
  };
  return entry;
}

}  // namespace quillane
