// What the freehand tools do to the picture: the brush and rubber disc, the pen's lines, and
// the Thin and Thick passes over a line drawing. Every routine clips to the picture, so a
// stroke may run past its edges or be larger than the whole picture.
#pragma once

#include <algorithm>

#include "freehand/color_model.h"
#include "imaging/bitmap32.h"

namespace quillane {

// A rectangle of picture pixels, right and bottom exclusive.
struct PaintRect {
  int left = 0;
  int top = 0;
  int right = 0;
  int bottom = 0;

  bool Empty() const { return right <= left || bottom <= top; }
  int Width() const { return right - left; }
  int Height() const { return bottom - top; }
  // The smallest rectangle holding both; an empty one adds nothing.
  PaintRect United(const PaintRect& other) const {
    if (other.Empty()) return *this;
    if (Empty()) return other;
    return {std::min(left, other.left), std::min(top, other.top), std::max(right, other.right),
            std::max(bottom, other.bottom)};
  }
  PaintRect ClippedTo(const Bitmap32& picture) const {
    PaintRect r{std::max(left, 0), std::max(top, 0), std::min(right, picture.Width()),
                std::min(bottom, picture.Height())};
    return r.Empty() ? PaintRect{} : r;
  }
  friend bool operator==(const PaintRect&, const PaintRect&) = default;
};

// The part of picture the disc of radius size around (x, y) covers: for each column c from
// x - size to x + size, rows y - k to y + k with k = Round(sqrt(size^2 - (x - c)^2)).
PaintRect DiscBounds(const Bitmap32& picture, int x, int y, int size);

// The rubber: every disc pixel becomes white.
PaintRect RubDisc(Bitmap32& picture, int x, int y, int size);
// The brush: every disc pixel that is no paper colour becomes its BrushColour.
PaintRect BrushDisc(Bitmap32& picture, int x, int y, int size, const FreehandHsl& brush);

// The pen of the picture: a width of 1 draws dashes (18 pixels on, 6 off, the pattern running
// on from one line of a stroke to the next), wider pens draw solid lines with round ends,
// width pixels across. Colour with alpha 255.
struct LinePen {
  Pixel color{0, 0, 0, 255};
  int width = 1;
  int dashPhase = 0;
};

// The pixels DrawLine may touch, before clipping.
PaintRect LineBounds(const Bitmap32& picture, int x0, int y0, int x1, int y1, int width);
// A line from (x0, y0) towards (x1, y1): a one-pixel line leaves out its end point, so the
// next line of a stroke starts there without drawing it twice, unless withEnd asks for it (a
// single line that must reach the point it was drawn to).
PaintRect DrawLine(Bitmap32& picture, LinePen& pen, int x0, int y0, int x1, int y1,
                   bool withEnd = false);

// One thinning pass: a pixel whose eight neighbours show 2 to 6 paper pixels, exactly one
// change from ink to paper walking round them (NW, N, NE, E, SE, S, SW, W), ink among N, E, S
// and among W, E, S becomes white when one of W, E, N, S is pure white, else the paper tint
// with alpha 0. Tests read the picture as it was before the pass; the outermost rows and
// columns never change.
void Thin(Bitmap32& picture);

// One thickening pass: a pure white pixel takes the colour (alpha 255) of its last neighbour
// in the order W, E, N, S that is not pure white; then a pixel in the paper tint takes the
// colour of its last neighbour in that order that is not the tint. Neighbours are read from
// the picture before the pass; the outermost rows and columns never change.
void Thick(Bitmap32& picture);

}  // namespace quillane
