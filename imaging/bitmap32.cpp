#include "imaging/bitmap32.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <vector>

#include "imaging/numeric.h"

namespace quillane {

Bitmap32::Store::Store(const Store& other) : Store(other.count_) {
  if (count_ != 0) std::memcpy(data_, other.data_, count_ * sizeof(Pixel));
}

Bitmap32::Store& Bitmap32::Store::operator=(const Store& other) {
  if (this == &other) return *this;
  if (count_ != other.count_) return *this = Store(other);
  if (count_ != 0) std::memcpy(data_, other.data_, count_ * sizeof(Pixel));
  return *this;
}

Bitmap32::Bitmap32(int width, int height, Pixel fill) {
  Allocate(width, height);
  std::fill(pixels_.data(), pixels_.data() + pixels_.size(), fill);
}

Bitmap32 Bitmap32::ForOverwrite(int width, int height) {
  Bitmap32 b;
  b.Allocate(width, height);
#ifndef NDEBUG
  // A pixel a routine forgets to write shows as this, not as the zeros fresh memory happens
  // to hold, so that the tests of the debug build find it.
  if (b.pixels_.size() != 0)
    std::memset(static_cast<void*>(b.pixels_.data()), 0xA5, b.pixels_.size() * sizeof(Pixel));
#endif
  return b;
}

void Bitmap32::Allocate(int width, int height) {
  if (width <= 0 || height <= 0) {
    width = 0;
    height = 0;
  }
  const std::int64_t count = static_cast<std::int64_t>(width) * height;
  if (count > kMaxPixels) throw std::length_error("Picture too large");
  // Release first, so that a large picture is never held twice during a resize.
  pixels_ = Store();
  width_ = 0;
  height_ = 0;
  pixels_ = Store(static_cast<std::size_t>(count));
  width_ = width;
  height_ = height;
}

void Bitmap32::SetSize(int width, int height) {
  Allocate(width, height);
  if (pixels_.size() != 0)
    std::memset(static_cast<void*>(pixels_.data()), 0, pixels_.size() * sizeof(Pixel));
}

bool operator==(const Bitmap32& a, const Bitmap32& b) {
  return a.width_ == b.width_ && a.height_ == b.height_ &&
         (a.pixels_.size() == 0 ||
          std::memcmp(a.Data(), b.Data(), a.pixels_.size() * sizeof(Pixel)) == 0);
}

void Bitmap32::DrawOver(int x, int y, Bitmap32& target) const {
  // Work in 64 bits so that placements near the int limits cannot overflow.
  const std::int64_t left = std::max<std::int64_t>(0, x);
  const std::int64_t top = std::max<std::int64_t>(0, y);
  const std::int64_t right = std::min<std::int64_t>(target.Width(), std::int64_t{x} + width_);
  const std::int64_t bottom = std::min<std::int64_t>(target.Height(), std::int64_t{y} + height_);
  if (left >= right || top >= bottom) return;

  for (std::int64_t ty = top; ty < bottom; ++ty) {
    Pixel* trow = target.ScanLine(static_cast<int>(ty));
    const Pixel* orow = ScanLine(static_cast<int>(ty - y));
    for (std::int64_t tx = left; tx < right; ++tx) {
      Pixel& t = trow[tx];
      const Pixel o = orow[tx - x];
      const std::uint32_t at = t.a;
      const std::uint32_t ao = o.a;
      if (at == 0 && ao == 0) {
        t = Pixel{255, 255, 255, 0};
      } else if (ao == 0) {
        // target unchanged
      } else if (at == 0 || ao == 255) {
        t = o;
      } else {
        const std::uint32_t d = 255 * (ao + at) - ao * at;
        const std::uint32_t wt = at * (255 - ao);
        const std::uint32_t wo = 255 * ao;
        t.b = static_cast<std::uint8_t>((wt * t.b + wo * o.b) / d);
        t.g = static_cast<std::uint8_t>((wt * t.g + wo * o.g) / d);
        t.r = static_cast<std::uint8_t>((wt * t.r + wo * o.r) / d);
        t.a = static_cast<std::uint8_t>(d / 255);
      }
    }
  }
}

void SetAlphaChannel(Bitmap32& bitmap, std::uint8_t value) {
  // Pixels read as 32-bit words, block by block: a block whose alpha bytes hold value already
  // is only read, so a picture a decoder made opaque costs one read pass instead of a rewrite.
  constexpr std::size_t kBlock = 4096;
  const auto word = [](Pixel p) {
    std::uint32_t w;
    std::memcpy(&w, &p, sizeof w);
    return w;
  };
  const std::uint32_t alphaMask = word(Pixel{0, 0, 0, 0xFF});
  const std::uint32_t alpha = word(Pixel{0, 0, 0, value});
  Pixel* p = bitmap.Data();
  const std::size_t n = bitmap.PixelCount();
  for (std::size_t start = 0; start < n; start += kBlock) {
    const std::size_t end = std::min(n, start + kBlock);
    std::uint32_t differ = 0;
    for (std::size_t i = start; i < end; ++i) differ |= word(p[i]) ^ alpha;
    if ((differ & alphaMask) == 0) continue;
    for (std::size_t i = start; i < end; ++i) p[i].a = value;
  }
}

void ResampleNearest(Bitmap32& bitmap, long double heightFactor, long double widthFactor) {
  const int w = bitmap.Width();
  const int h = bitmap.Height();
  const Extended nw = static_cast<Extended>(w) * widthFactor;
  const Extended nh = static_cast<Extended>(h) * heightFactor;
  // Anything that is not a finite size inside the accepted range becomes empty rather than
  // being converted (an out-of-range float-to-int conversion is undefined).
  const auto valid = [](Extended v) { return std::isfinite(v) && v >= 1.0L && v < 2147483648.0L; };
  if (w == 0 || !valid(nw) || !valid(nh)) {
    bitmap = Bitmap32();
    return;
  }
  const int newW = Trunc(nw);
  const int newH = Trunc(nh);
  if (newW == w && newH == h) return;

  Bitmap32 result(newW, newH);
  std::vector<int> column(static_cast<std::size_t>(newW));
  for (int x = 0; x < newW; ++x)
    column[static_cast<std::size_t>(x)] = static_cast<int>(static_cast<std::int64_t>(x) * w / newW);
  for (int y = 0; y < newH; ++y) {
    const Pixel* src = bitmap.ScanLine(static_cast<int>(static_cast<std::int64_t>(y) * h / newH));
    Pixel* dst = result.ScanLine(y);
    for (int x = 0; x < newW; ++x) dst[x] = src[column[static_cast<std::size_t>(x)]];
  }
  bitmap = std::move(result);
}

}  // namespace quillane
