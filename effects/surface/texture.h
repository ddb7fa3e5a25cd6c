// Texture: a gray surface tile laid over the picture by moving each pixel's lightness.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// A picture of base's size: every pixel through RGB to HSL, its lightness L moved by
// Round((Lt - 70) pressure / 50) (halves to even) and limited to 0..100, where Lt is the
// lightness of the tile pixel at (x mod tile width, y mod tile height), then back through HSL
// to RGB with alpha 255. pressure 0..100. An empty tile leaves the lightness as it is.
Bitmap32 texture(const Bitmap32& base, const Bitmap32& tile, int pressure);

// What a tile pixel of lightness tileLightness (0..100) adds to the picture's lightness:
// Round((tileLightness - 70) pressure / 50), kept within -100..100 (no lightness moves further).
int TextureLightnessShift(int tileLightness, int pressure);

}  // namespace quillane
