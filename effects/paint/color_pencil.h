// Colour pencil: the picture's own colours on white paper, lightened towards white wherever
// its edge map is light.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// For every pixel, borders included:
//   g  = gray value of the pixel in the edge map (InvertedSobelEdges) of source;
//   Le = Round(100 g / 255), the HSL lightness of (g, g, g);
//   e  = the lightness contrast curve of Le at position pressure (0..89);
//   (H, S, L) = RGB to HSL of the source pixel;
//   L' = Round(e / 100 * (100 - L)) + L, in extended precision, halves to even;
//   the pixel is HSL to RGB of (H, S, L'), alpha 255.
// Pressure 45 uses the edge map as it is; 0 gives white everywhere.
Bitmap32 ColorPencil(const Bitmap32& source, int pressure);

// The same into out, which must already have source's size (a caller that runs the effect
// again and again reuses one picture).
void ColorSketchInto(const Bitmap32& source, int pressure, Bitmap32& out);

// The steps above that the tables are built from: e from an edge-map gray value g, and L' from
// e and L.
int ColorPencilEdgeTone(int gray, int pressure);
int ColorPencilLightness(int e, int l);

}  // namespace quillane
