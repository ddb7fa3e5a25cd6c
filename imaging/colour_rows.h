// Row kernels of the colour effects that change each pixel on its own: a tint of the colour
// channels, and a colour laid over the picture in stripes. Each has a plain variant and one
// for processors with AVX2, chosen once per call; both give the same bytes.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// A change of a pixel, byte by byte of its 0xAARRGGBB word: raised by add (stopping at 255),
// lowered by sub (stopping at 0), then the bits of clear cleared and those of set raised.
struct ChannelTint {
  std::uint32_t add = 0, sub = 0, clear = 0, set = 0;
};

Pixel Tinted(Pixel p, const ChannelTint& tint);

// out[x] = Tinted(in[stride * x]) for x < n, stride 1 or 2. With alphaOf, each result takes
// the alpha of alphaOf[x] instead. out must not overlap in or alphaOf.
void TintRow(const Pixel* in, int stride, const Pixel* alphaOf, Pixel* out, int n,
             const ChannelTint& tint);

// A stripe colour o (alpha 1..255) laid over pixels. Opaque pixels take
// ((255 - a) t + a o) div 255 per channel; the others the full DrawOver quotient.
Pixel StripeOver(Pixel o, Pixel t);

// out[x] for x < n: where stripe[x] is all ones, StripeOver(o, in[x]); where it is 0, in[x],
// but a pixel of alpha 0 becomes transparent white (255, 255, 255, 0). o.a must not be 0
// where a stripe is. out must not overlap in.
void StripeRow(const Pixel* in, Pixel* out, int n, const std::uint32_t* stripe, Pixel o);

}  // namespace quillane
