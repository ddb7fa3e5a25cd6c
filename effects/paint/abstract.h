// Abstract: a coloured line drawing on a light ground, from a kernel the user types in and the
// left-to-right darkening of the picture.
#pragma once

#include "effects/paint/kernel_gradient.h"

namespace quillane {

// KernelGradientFilter of source with k and the left-minus-right gradient. With the default
// kernel (all weights 0 or -1) the kernel never responds, and the drawing shows where the
// picture darkens from left to right. Alpha is 255 everywhere.
Bitmap32 Abstract(const Bitmap32& source, const Kernel& k);

}  // namespace quillane
