// Pen sketch: the edge map thresholded to black ink on white paper.
#pragma once

#include "imaging/bitmap32.h"
#include "imaging/ink_rows.h"

namespace quillane {

// Every pixel whose gray value (GrayValue) is above level becomes paper, every other pixel
// ink; alpha 255 either way. A gray value equal to level is ink.
void ThresholdToInk(Bitmap32& bitmap, int level);

// The edge map of a copy of source (InvertedSobelEdges), thresholded at pressure (0..255); made row
// by row from the gray values of the edge map, without the edge map as a picture.
Bitmap32 PenSketch(const Bitmap32& source, int pressure);

}  // namespace quillane
