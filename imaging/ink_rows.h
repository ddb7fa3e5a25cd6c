// Rows of the two-valued drawings (black ink on white paper) while they are being worked on: one
// byte a pixel, 0 for ink and 0xFF for paper, so that an AND of rows spreads ink, an OR spreads
// paper, and the pixels follow from the bytes by widening them.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

inline constexpr Pixel kInk{0, 0, 0, 255};
inline constexpr Pixel kPaper{255, 255, 255, 255};

// The pixels of n cells (each 0 or 0xFF): paper for 0xFF, ink for 0. With colours, ink takes the
// blue, green and red of colours[x] and alpha 255. The pixels may go past the caches: a band
// that wrote any ends with EndStreamedRows() before another thread reads them.
void InkPixels(const std::uint8_t* cells, int n, Pixel* out, const Pixel* colours = nullptr);

// Orders the pixels stored past the caches before those of later stores.
void EndStreamedRows();

}  // namespace quillane
