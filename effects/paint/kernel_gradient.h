// The filter behind abstract and pop art: per colour channel, the larger of a 3 x 3 kernel's
// response and a fixed gradient's, as dark lines on a light ground.
#pragma once

#include "effects/paint/kernel_rows.h"
#include "imaging/bitmap32.h"

namespace quillane {

// The fixed second operator, over a channel c at (x, y):
enum class Gradient {
  // Abstract: [c(x-1, y-1) - c(x+1, y-1)] + [c(x-1, y) - c(x+1, y)] + [c(x-1, y+1) - c(x+1, y+1)].
  LeftMinusRight,
  // Pop art: [c(x+1, y-1) + 2 c(x+1, y) + c(x+1, y+1)] - [c(x-1, y-1) + 2 c(x-1, y) + c(x-1, y+1)].
  RightMinusLeftSobel,
};

// For every interior pixel and each of B, G, R alone, with K the kernel's weighted sum over
// the 3 x 3 block (k0 top left .. k8 bottom right) and D the gradient, both read from picture:
//   max(clamp(K), clamp(D)), each clamped to 0..255.
// Then the frame repeats its inner neighbours (first pixel 0 and W-1 of rows 1..H-2 take the
// colours of pixels 1 and W-2, then rows 0 and H-1 take rows 1 and H-2, so corners take their
// diagonal neighbour), and every colour byte v becomes 255 - v. Alpha is 255 everywhere.
// Sums are formed in 64 bits, so no weights a cell holds overflow. A picture too small for a
// neighbour on one side repeats what it has there: 1 pixel high or wide is the inverted input
// along that side; 2 gives both lines the inverted second line.
Bitmap32 KernelGradientFilter(const Bitmap32& picture, const Kernel& k, Gradient gradient);

// The same into out, which must already have picture's size.
void KernelGradientFilterInto(const Bitmap32& picture, const Kernel& k, Gradient gradient,
                              Bitmap32& out);

// The same step by step, pixel by pixel in 64-bit sums: what the two above fall back on for
// kernels the row pass cannot sum and for pictures under 3 by 3, and the reference the tests
// compare the row pass with.
Bitmap32 KernelGradientPlain(const Bitmap32& picture, const Kernel& k, Gradient gradient);

}  // namespace quillane
