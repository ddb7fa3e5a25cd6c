// The drawing effects (effects/mono/) written out step by step: what their fused, banded passes
// must equal.
#pragma once

#include "effects/mono/bw_sketch.h"
#include "imaging/bitmap32.h"

namespace quillane {

// PencilSketch step by step and pixel by pixel through the plain edge map, gray value and tone
// pass; the oracle that PencilSketch must equal. For pictures of at least 3 by 3.
Bitmap32 PencilSketchReference(const Bitmap32& source, PencilToneMode mode, int contrast,
                               int lighting);

}  // namespace quillane
