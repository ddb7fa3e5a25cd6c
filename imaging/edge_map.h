// The edge map that every drawing effect starts from.
#pragma once

#include <array>
#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// Replaces bitmap by its edge map, per colour channel independently. For an interior pixel
// each of B, G, R becomes
//   255 - max(clamp(A), clamp(B))
// where A is the line kernel [-1 -1 -1; 0 6 0; -1 -1 -1] and B the left-minus-right kernel
// [1 0 -1; 1 0 -1; 1 0 -1] over the 3 by 3 neighbourhood of the input, in integers, each
// clamped to 0..255. Border pixels repeat their inner neighbours: first the left and right
// columns take columns 1 and W-2 of their row, then rows 0 and H-1 take rows 1 and H-2, so the
// corners equal the diagonal interior pixel. All bytes are then inverted; alpha is left to the
// caller. A picture too small for a neighbour on one side repeats what it has: 1 wide or 1 high
// gives the inverted input along that direction, 2 gives both lines the inverted second line.
void InvertedSobelEdges(Bitmap32& bitmap);

// A new picture whose every pixel is levels[gray value of the edge map's pixel] in B, G and R,
// alpha 255: what InvertedSobelEdges on a copy of source, then ConvertToGray and a per-level table
// give, in one pass over rows that stay in cache, without the edge map as a picture. source is not
// changed.
Bitmap32 GrayEdgeLevels(const Bitmap32& source, const std::array<std::uint8_t, 256>& levels);

// Row y (0 .. height - 1) of the edge map of source thresholded at level, one byte a pixel into
// cells[0 .. width - 1]: 0xFF where the gray value (GrayValue) of what InvertedSobelEdges makes of
// a copy of source is above level, 0 elsewhere; from source's rows y - 1 to y + 1 alone, without
// the edge map or its gray values. For sources of at least 3 by 3.
void GrayEdgeCells(const Bitmap32& source, int y, int level, std::uint8_t* cells);

// Row y of the edge map's gray values (GrayValue of what InvertedSobelEdges makes of a copy of
// source) into gray[0 .. width - 1], from source's rows y - 1 to y + 1 alone, for passes that use
// them beside the picture itself. For sources of at least 3 by 3; any thread, any order of rows.
void GrayEdgeRow(const Bitmap32& source, int y, std::uint8_t* gray);

}  // namespace quillane
