// The drawing effects (effects/mono/) written out step by step: what their fused, banded passes
// must equal.
#pragma once

#include "effects/mono/bw_sketch.h"
#include "effects/mono/vuzorar.h"
#include "imaging/bitmap32.h"

namespace quillane {

// PencilSketch step by step and pixel by pixel through the plain edge map, gray value and tone
// pass; the oracle that PencilSketch must equal. For pictures of at least 3 by 3.
Bitmap32 PencilSketchReference(const Bitmap32& source, PencilToneMode mode, int contrast,
                               int lighting);

// The pen sketch the plain way, pixel by pixel through GrayValue; the oracle that PenSketch's
// row-wise gray levels must equal.
Bitmap32 PenSketchReference(const Bitmap32& source, int pressure);

// One pass of directional ink dilation, in place: every interior pixel (rows and columns 1 to
// size - 2) that is not ink (some of B, G, R non-zero) becomes ink (B, G, R = 0, alpha kept)
// when either of its two neighbours in direction was ink before the pass. Border rows and
// columns never change; pictures under 3 rows or columns are left as they are.
// std::invalid_argument for a direction outside 1..4.
void BitmapDilate(Bitmap32& bitmap, HatchDirection direction);

// Vuzorar's steps themselves: PenSketchReference, then BitmapDilate scope times. The oracle that
// the fused, banded Vuzorar must equal.
Bitmap32 VuzorarReference(const Bitmap32& source, int pressure, int scope,
                          HatchDirection direction);

// Every pixel whose InkGrayValue is above threshold becomes paper (255, 255, 255, 255), every
// other pixel ink (0, 0, 0, 255).
void PictureTwoValue(Bitmap32& bitmap, int threshold);

// The outline of a thresholded picture: every interior pixel whose whole 3 by 3 neighbourhood
// is ink (B, G, R all 0) becomes paper (255, 255, 255, 255); every other pixel, the border rows
// and columns included, is kept. Pictures under 3 rows or columns are returned unchanged.
Bitmap32 OutlineDarkAreas(const Bitmap32& thresholded);

// Every ink pixel (red 0) of outline takes the B, G, R of the same pixel of source, alpha 255;
// paper is kept. Both pictures have the same size.
void ColorValue(Bitmap32& outline, const Bitmap32& source);

// Those three steps in turn; the oracle that the fused PenAndInk must equal.
Bitmap32 PenAndInkReference(const Bitmap32& source, int threshold, bool colorInk);

}  // namespace quillane
