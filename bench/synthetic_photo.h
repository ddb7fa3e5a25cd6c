// The picture every benchmark works on: the start-up picture enlarged smoothly to photo size
// with a little per-channel grain, so that it has the soft gradients, edges and noise (and the
// many distinct colours) of a camera photo.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>

#include "data/startup_picture.h"
#include "imaging/bitmap32.h"

namespace quillane::bench {

inline std::uint32_t Hash(std::uint32_t x) {
  x ^= x >> 16;
  x *= 0x7feb352dU;
  x ^= x >> 15;
  x *= 0x846ca68bU;
  x ^= x >> 16;
  return x;
}

inline Bitmap32 SyntheticPhoto(int width, int height) {
  const Bitmap32 small = StartupPicture();
  Bitmap32 big(width, height);
  const int sw = small.Width(), sh = small.Height();
  for (int y = 0; y < height; ++y) {
    const double fy = (y + 0.5) * sh / height - 0.5;
    const int y0 = std::clamp(static_cast<int>(std::floor(fy)), 0, sh - 1);
    const int y1 = std::min(y0 + 1, sh - 1);
    const double ty = std::clamp(fy - y0, 0.0, 1.0);
    const Pixel* r0 = small.ScanLine(y0);
    const Pixel* r1 = small.ScanLine(y1);
    Pixel* out = big.ScanLine(y);
    for (int x = 0; x < width; ++x) {
      const double fx = (x + 0.5) * sw / width - 0.5;
      const int x0 = std::clamp(static_cast<int>(std::floor(fx)), 0, sw - 1);
      const int x1 = std::min(x0 + 1, sw - 1);
      const double tx = std::clamp(fx - x0, 0.0, 1.0);
      const std::uint32_t noise =
          Hash(static_cast<std::uint32_t>(y) * 65537u + static_cast<std::uint32_t>(x));
      const auto channel = [&](std::uint8_t Pixel::*c, int shift) {
        const double top = r0[x0].*c + (r0[x1].*c - r0[x0].*c) * tx;
        const double bottom = r1[x0].*c + (r1[x1].*c - r1[x0].*c) * tx;
        const double v = top + (bottom - top) * ty + static_cast<int>((noise >> shift) & 7) - 3.5;
        return static_cast<std::uint8_t>(std::clamp(static_cast<int>(std::lround(v)), 0, 255));
      };
      out[x] = Pixel{channel(&Pixel::b, 0), channel(&Pixel::g, 3), channel(&Pixel::r, 6), 255};
    }
  }
  return big;
}

// The 12-megapixel photo the benchmarks share, made once per program.
constexpr int kPhotoWidth = 4000;
constexpr int kPhotoHeight = 3000;
inline const Bitmap32& Photo() {
  static const Bitmap32 photo = SyntheticPhoto(kPhotoWidth, kPhotoHeight);
  return photo;
}

}  // namespace quillane::bench
