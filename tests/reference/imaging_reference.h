// The pixel core's routines written out the plain way, pixel by pixel and straight from their
// formulas: what the banded, table-driven and vector versions in imaging/ must equal.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"
#include "imaging/tone.h"

namespace quillane {

// The same edge map as InvertedSobelEdges computed the plain way, pixel by pixel and channel by
// channel from a snapshot, border columns, border rows, then the inversion. InvertedSobelEdges
// must equal it byte for byte, alpha included; it is kept as the oracle for the banded, threaded
// fast path. For pictures of at least 3 by 3.
Bitmap32 InvertedSobelEdgesReference(const Bitmap32& input);

// GrayRowInto through GrayValue, pixel by pixel: what the faster variants must equal.
void GrayRowIntoReference(const Pixel* in, Pixel* out, int width, std::uint32_t set);

// The two conversions written straight from the formulas of RgbToHsl and HslToRgb, one branch
// per case. The table- and integer-based RgbToHsl and HslToRgb must equal them for every input;
// they are kept as the oracles for those fast paths.
Hsl RgbToHslReference(int r, int g, int b);
Rgb HslToRgbReference(int h, int s, int l);

// PencilContrastPass pixel by pixel through the reference conversions and LightnessContrast;
// the oracle that the fast pass must equal.
Bitmap32 PencilContrastPassReference(const Bitmap32& input, int c);

}  // namespace quillane
