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

// The whole effect: source thresholded at threshold (0..255), every pixel whose InkGrayValue
// is above it paper (255, 255, 255, 255), every other ink (0, 0, 0, 255); then its outline,
// every interior pixel whose whole 3 by 3 neighbourhood is ink becoming paper while the border
// rows and columns keep their pixels; then with colorInk every ink pixel of the outline takes
// the B, G, R of the source's pixel, alpha 255.
Bitmap32 PenAndInk(const Bitmap32& source, int threshold, bool colorInk);

}  // namespace quillane
