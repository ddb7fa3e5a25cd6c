// Stria: evenly spaced, semi-transparent stripes of one colour laid over the picture.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

enum class StriaDirection { Vertical = 1, Horizontal = 2 };

// A copy of base with a stripe layer of layerWidth x layerHeight composited over it at (0, 0)
// with DrawOver: with period p = thickness + space, the pixels whose column (vertical) or row
// (horizontal) m satisfies m mod p < thickness are colour (0x00BBGGRR) with alpha
// 255 - transparency, the others transparent white (255, 255, 255, 0). Over an opaque pixel a
// stripe gives ((255 - a) base + a colour) div 255 per channel; a gap leaves it; over alpha 0
// a stripe is copied as it is and a gap becomes (255, 255, 255, 0). Only the area both share
// is touched. thickness 1..100, space 1..255, transparency 0..255.
Bitmap32 stria(const Bitmap32& base, int layerWidth, int layerHeight, StriaDirection direction,
               int thickness, int space, int transparency, std::uint32_t colour);

// The stripes' pixel: colour (0x00BBGGRR) with alpha 255 - transparency, transparency limited
// to 0..255.
Pixel StripeColour(std::uint32_t colour, int transparency);

}  // namespace quillane
