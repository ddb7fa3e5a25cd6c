// The surface effects (effects/surface/) written out pixel by pixel: what their table-driven and
// vector passes must equal.
#pragma once

#include <cstdint>

#include "effects/surface/stria.h"
#include "imaging/bitmap32.h"

namespace quillane {

// emboss pixel by pixel on one thread, straight from its formula: the reference for emboss.
Bitmap32 EmbossReference(const Bitmap32& source, int lighting, int depth);

// stria made the plain way, in place on a copy through tables of the colour: what stria must
// equal.
Bitmap32 StriaReference(const Bitmap32& base, int layerWidth, int layerHeight,
                        StriaDirection direction, int thickness, int space, int transparency,
                        std::uint32_t colour);

// texture pixel by pixel through the reference conversions: the oracle for texture.
Bitmap32 TextureReference(const Bitmap32& base, const Bitmap32& tile, int pressure);

}  // namespace quillane
