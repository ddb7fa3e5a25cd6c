// The adjusting effects (effects/adjust/) made the plain way: what their row passes must equal.
#pragma once

#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "imaging/bitmap32.h"

namespace quillane {

// ColorFilter made the plain way, row by row in place on a copy: what ColorFilter must equal.
Bitmap32 FilterReference(const Bitmap32& base, ColorFilterKind kind);

// ColorPanel made the plain way, pixel by pixel through the half- and third-size copies and the
// zone of every pixel: what ColorPanel must equal.
Bitmap32 ColorPanelReference(const Bitmap32& source, PanelLayout layout);

}  // namespace quillane
