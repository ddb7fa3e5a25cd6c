// HSL adjust: hue turned round the colour wheel, saturation and lightness moved by fixed
// amounts.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// Every pixel of a copy of source through the integer colour model: H' = (H + hue + 180) mod
// 360, S' = S + saturation - 100 and L' = L + lighting - 100, both limited to 0..100, and back;
// alpha 255. Positions: hue 0..360 (180 neutral), saturation and lighting 0..200 (100 neutral).
// Neutral positions still shift many colours by the conversions' rounding.
Bitmap32 HslAdjust(const Bitmap32& source, int hue, int saturation, int lighting);

}  // namespace quillane
