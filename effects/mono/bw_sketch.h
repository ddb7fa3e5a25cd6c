// Pencil sketch: the gray edge map of the picture, shifted in brightness or passed through the
// lightness contrast curve.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

enum class PencilToneMode { Contrast = 0, Lighting = 1 };

// The edge map of a copy of source, then:
//  Contrast: made gray (gray value in B, G, R; alpha 255), then through the pencil contrast
//            pass with position contrast (0..89);
//  Lighting: the edge map itself through the pencil lighting pass with position lighting
//            (0..255).
// The position of the mode not chosen is ignored. Alpha of the result is 255.
Bitmap32 PencilSketch(const Bitmap32& source, PencilToneMode mode, int contrast, int lighting);

}  // namespace quillane
