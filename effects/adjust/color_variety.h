// Colour variety: the colour balance shifted step by step by swatch clicks.
#pragma once

#include <cstdint>
#include <vector>

#include "imaging/bitmap32.h"

namespace quillane {

// Swatches 1..6: more red, green, blue, yellow (red and green), cyan (green and blue), purple
// (red and blue).
//
// One click: a copy of picture with each channel of the swatch raised by 10, limited to 255;
// alpha 255.
Bitmap32 variety(const Bitmap32& picture, int swatch);

// The clicks in order, starting from base: the same as variety click after click (the limits
// compose), in one pass. No click gives base unchanged.
Bitmap32 VarietyClicks(const Bitmap32& base, const std::vector<std::int64_t>& clicks);

}  // namespace quillane
