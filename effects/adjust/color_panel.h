// Colour panel: the picture as several differently tinted versions side by side.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// The six layouts, numbered as their buttons are.
enum class PanelLayout {
  Panel2x2 = 1,
  Panel3x3 = 2,
  Pane2x2 = 3,
  Pane3x3 = 4,
  Catercorner4 = 5,
  Catercorner16 = 6,
};

// The floods the 2 x 2 layouts share: A red = 255; B green = 255, blue = 0; C red = 0,
// blue = 255; D red = 255, blue = 255.
//
// Panel2x2: the source with its four quadrants overwritten (colour only) by a half-size copy
//   (ResampleNearest 0.5, w = W div 2, h = H div 2) flooded A (top left), B (top right),
//   C (bottom left), D (bottom right), skipping each copy's first row and column; W x H.
// Panel3x3: a third-size copy (ResampleNearest by 1/3 in extended precision: w = W div 3,
//   h = H div 3) tiled 3 x 3 with each tile tinted its own way; 3w x 3h with alpha 0 (empty
//   when W or H is below 3).
// Pane2x2: floods A, C (top), B, D (bottom) on the quadrants split at x < W/2, y < H/2.
// Pane3x3: nine zones split at x <= W/3, x <= 2W/3 (and the same for y), each tinted its way.
// Catercorner4: floods by the triangles the diagonals cut: bottom D, left C, right B, top A,
//   the main diagonal being x <= (W / H) y in extended precision and the anti-diagonal
//   x >= W (H - y) / H.
// Catercorner16: the same inside each quadrant (top where y <= H/2, left where x <= W/2).
// Every layout but Panel3x3 keeps row 0 and column 0 of the source.
Bitmap32 ColorPanel(const Bitmap32& source, PanelLayout layout);

// What tile (or zone) number tile of layout makes of a pixel: channels raised or lowered
// (limited to 0..255), then cleared to 0 and set to 255; alpha kept. Panel2x2 numbers its
// quadrants 0..3 for the floods A..D, Panel3x3 its tiles 0..8 by row then column, and the other
// layouts their zones as ColorPanelZone gives them. A number outside the layout's leaves p.
Pixel ColorPanelTinted(Pixel p, PanelLayout layout, int tile);

// The zone that pixel (x, y) (each from 1) of a w x h source lies in, for Pane2x2 (0..3),
// Pane3x3 (0..8) and the catercorner layouts (0..3); 0 for the others.
int ColorPanelZone(PanelLayout layout, int w, int h, int x, int y);

}  // namespace quillane
