// Pen and ink: the outlines of the dark areas of the photograph.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// This effect's own gray value: Round(0.299 R + 0.587 G + 0.11 B) in extended precision. The
// weights sum to 0.996, so white is 254.
std::uint8_t InkGrayValue(int r, int g, int b);
// cells[x] = 0xFF (paper) where InkGrayValue of in[x] is above threshold, else 0 (ink), for the
// first count pixels: in integers, many pixels at a time.
void InkThresholdCells(const Pixel* in, int count, int threshold, std::uint8_t* cells);

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

// The whole effect: source thresholded at threshold (0..255), its outline, then with colorInk
// the outline's ink in the source's colours. Identical to the three steps above in turn.
Bitmap32 PenAndInk(const Bitmap32& source, int threshold, bool colorInk);

// Those three steps in turn; the oracle that the fused PenAndInk must equal.
Bitmap32 PenAndInkReference(const Bitmap32& source, int threshold, bool colorInk);

}  // namespace quillane
