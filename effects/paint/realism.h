// Realism: the picture filtered with a 3 x 3 kernel the user types in.
#pragma once

#include <cstdint>

#include "effects/paint/kernel_rows.h"
#include "imaging/bitmap32.h"

namespace quillane {

// A copy of picture with every interior pixel (rows 1..H-2, columns 1..W-2) filtered, each of
// B, G, R alone:
//   s = k0 c(x-1, y-1) + k1 c(x, y-1) + ... + k8 c(x+1, y+1),
//   q = s / divisor truncated toward zero, clamped to 0..255; alpha 255.
// Every tap reads the input picture. The sum is formed in 64 bits, so no weights the cells
// can hold overflow: a sum beyond 32 bits clamps like any other. A divisor of 0 is taken as 1.
// The one-pixel frame keeps the input's colours and alpha; a picture under 3 pixels wide or
// high comes back unchanged.
Bitmap32 Convolve(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor);

// The same into out, which must already have picture's size.
void ConvolveInto(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor, Bitmap32& out);

// The same pixel by pixel in 64-bit sums on one thread: what Convolve falls back on for
// kernels the row pass cannot sum and for divisors above 1, and the reference the tests compare
// the row pass with.
Bitmap32 ConvolvePlain(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor);

// Realism: Convolve of the source picture with divisor 1.
Bitmap32 realism(const Bitmap32& source, const Kernel& k);

}  // namespace quillane
