// The surface effects (effects/surface/) written out pixel by pixel: what their table-driven and
// vector passes must equal.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// texture pixel by pixel through the reference conversions: the oracle for texture.
Bitmap32 TextureReference(const Bitmap32& base, const Bitmap32& tile, int pressure);

}  // namespace quillane
