// What the work area and its control panel share for the whole run: the tool, the pen size and
// the brush colour persist from one opening to the next.
#pragma once

#include "freehand/color_model.h"

namespace quillane {

struct PaintingState {
  enum Tool { kNoTool = 0, kEyedropper = 1, kRubber = 2, kBrush = 3, kBeeline = 4, kPen = 5 };
  static constexpr int kMinPenSize = 1;
  static constexpr int kMaxPenSize = 100;

  int tool = kNoTool;
  int penSize = 16;
  Pixel brushColor{0, 0, 0, 255};
  FreehandHsl brush;  // brushColor in the freehand colour model
  bool controlPanelOpen = false;

  void SetBrushColor(Pixel color) {
    brushColor = Pixel{color.b, color.g, color.r, 255};
    brush = RGBtoHSL(brushColor);
  }
};

}  // namespace quillane
