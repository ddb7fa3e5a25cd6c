// Emboss: a gray relief from each pixel against its neighbour further down and to the right.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// A copy of source in which every pixel P at (x, y) whose neighbour Q at (x + depth,
// y + depth) lies inside the picture becomes the gray value (Round(0.3 vr + 0.59 vg + 0.11 vb),
// extended precision, halves to even) of v = min(255, |P - Q + lighting + 50|) per channel,
// alpha 255. The rightmost depth columns and bottom depth rows keep the source pixels, colour
// and alpha. lighting 0..200, depth 1..5 (any depth >= 1 works).
Bitmap32 emboss(const Bitmap32& source, int lighting, int depth);

}  // namespace quillane
