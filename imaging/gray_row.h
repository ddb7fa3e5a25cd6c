// Gray rows written from one picture's rows into another's, with the channels a colour filter
// raises already set: the colour effects that start from gray make their result in one pass.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// For the first width pixels: each pixel's gray value (GrayValue) in B, G and R, alpha 255,
// then the bits of set (a 0xAARRGGBB word) raised. in and out must not overlap. The variant
// for this processor is chosen once per call.
void GrayRowInto(const Pixel* in, Pixel* out, int width, std::uint32_t set);

}  // namespace quillane
