// Vuzorar: the pen drawing with every ink pixel drawn out into a short hatching stroke.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// The stroke directions; each names the two neighbours a dilation pass looks at.
enum class HatchDirection {
  Rising = 1,      // lower left and upper right
  Falling = 2,     // upper left and lower right
  Vertical = 3,    // above and below
  Horizontal = 4,  // left and right
};

// The two neighbours that a dilation pass in a direction looks at, as offsets from the pixel.
// std::invalid_argument for a direction outside 1..4.
struct HatchNeighbours {
  int dx1, dy1, dx2, dy2;
};
HatchNeighbours HatchNeighboursOf(HatchDirection direction);

// The pen sketch of source at pressure (0..255), then scope (1..10) dilation passes in
// direction. In each pass every interior pixel (rows and columns 1 to size - 2) that is not ink
// (some of B, G, R non-zero) becomes ink (B, G, R = 0, alpha kept) when either of its two
// neighbours in direction was ink before the pass; border rows and columns never change.
Bitmap32 Vuzorar(const Bitmap32& source, int pressure, int scope, HatchDirection direction);

}  // namespace quillane
