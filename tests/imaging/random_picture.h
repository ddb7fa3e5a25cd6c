// Seeded random pictures for the comparisons of fast paths against their plain references.
#pragma once

#include <random>

#include "imaging/bitmap32.h"

namespace quillane {

// Every byte random; when grayish, three pixels in four are gray with a random level.
inline Bitmap32 RandomPicture(int w, int h, unsigned seed, bool grayish = false) {
  std::mt19937 rng(seed);
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const std::uint32_t v = rng();
      Pixel p{static_cast<std::uint8_t>(v), static_cast<std::uint8_t>(v >> 8),
              static_cast<std::uint8_t>(v >> 16), static_cast<std::uint8_t>(v >> 24)};
      if (grayish && (v >> 30) != 0) p.g = p.r = p.b;
      b.At(x, y) = p;
    }
  return b;
}

}  // namespace quillane
