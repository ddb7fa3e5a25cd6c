// Pen sketch: the edge map thresholded to black ink on white paper.
// Its window opens from the menu; the effect itself is still to come.
#include "effects/registry.h"

namespace quillane {

const EffectSpec& PenSketchEffect() {
  static const EffectSpec entry{
      .toolNumber = 2,
      .menu = EffectMenu::Mono,
      .menuPosition = 2,
      .menuEntry = "Pen sketch",
      .menuHandler = "Pensketch1Click",
      .windowClass = "TPen_Sketch",
      .caption = "Pen_Sketch",
      .statusText = "Pen Sketch",
      .cliName = "pen-sketch",
      .batchTag = "PenSketch",
      .collapsedHeight = 108,
      .expandedHeight = 184,
      .colorUp = true,
  };
  return entry;
}

}  // namespace quillane
