// Pop art: the picture's edges as bold coloured lines on a light ground, like a screen print.
#pragma once

#include "effects/paint/kernel_gradient.h"

namespace quillane {

// KernelGradientFilter of source with k and the right-minus-left Sobel gradient. With the
// default kernel (bottom row minus top row, weights 1, 2, 1) each channel shows the larger of
// its downward and rightward brightening, inverted. Alpha is 255 everywhere.
Bitmap32 PopArt(const Bitmap32& source, const Kernel& k);

}  // namespace quillane
