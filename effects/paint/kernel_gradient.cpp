#include "effects/paint/kernel_gradient.h"

#include <algorithm>
#include <cstring>

#include "imaging/parallel.h"
#include "imaging/row_pass.h"

namespace quillane {
namespace {

// The gradients as kernels.
Kernel GradientKernel(Gradient gradient) {
  if (gradient == Gradient::LeftMinusRight) return {1, 0, -1, 1, 0, -1, 1, 0, -1};
  return {-1, 0, 1, -2, 0, 2, -1, 0, 1};
}

std::int64_t WeightedSum(const TBitmap32& picture, const Kernel& k, int x, int y,
                         std::uint8_t Pixel::*c) {
  std::int64_t s = 0;
  for (int t = 0; t < 9; ++t)
    s += k[static_cast<std::size_t>(t)] * picture.At(x + t % 3 - 1, y + t / 3 - 1).*c;
  return s;
}

// The gradients weigh one column of three against the next but one: each column's weighted
// sum is formed once and serves both neighbours. sums[i] = sign (column(i - 4) - column(i + 4))
// over byte first + i, with the middle row weighing middleWeight.
void GradientSums(const std::uint8_t* const rows[3], int first, int count, int middleWeight,
                  int sign, std::int16_t* __restrict sums) {
  std::int16_t columns[kSumChunk + 8];
  const std::uint8_t* __restrict above = rows[0] + first - 4;
  const std::uint8_t* __restrict row = rows[1] + first - 4;
  const std::uint8_t* __restrict below = rows[2] + first - 4;
  for (int i = 0; i < count + 8; ++i)
    columns[i] = static_cast<std::int16_t>(above[i] + middleWeight * row[i] + below[i]);
  for (int i = 0; i < count; ++i)
    sums[i] = static_cast<std::int16_t>(sign * (columns[i] - columns[i + 8]));
}

std::int64_t Clamp(std::int64_t v) {
  return v < 0 ? 0 : (v > 255 ? 255 : v);
}

void CopyColour(Pixel& to, const Pixel& from) {
  to.b = from.b;
  to.g = from.g;
  to.r = from.r;
}

}  // namespace

TBitmap32 KernelGradientReference(const TBitmap32& picture, const Kernel& k, Gradient gradient) {
  const Kernel g = GradientKernel(gradient);
  TBitmap32 a = picture;
  const int w = picture.Width();
  const int h = picture.Height();
  for (int y = 1; y < h - 1; ++y)
    for (int x = 1; x < w - 1; ++x) {
      for (std::uint8_t Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b})
        a.At(x, y).*c = static_cast<std::uint8_t>(std::max(
            Clamp(WeightedSum(picture, k, x, y, c)), Clamp(WeightedSum(picture, g, x, y, c))));
      a.At(x, y).a = 0;
    }
  const int innerLeft = std::min(1, w - 1), innerRight = std::max(w - 2, 0);
  for (int y = 1; y < h - 1; ++y) {
    CopyColour(a.At(0, y), a.At(innerLeft, y));
    CopyColour(a.At(w - 1, y), a.At(innerRight, y));
  }
  for (auto [to, from] : {std::pair{0, std::min(1, h - 1)}, {h - 1, std::max(h - 2, 0)}})
    for (int x = 0; x < w && h > 0; ++x) CopyColour(a.At(x, to), a.At(x, from));
  for (Pixel* p = a.Data(); p != a.Data() + a.PixelCount(); ++p)
    *p = Pixel{static_cast<std::uint8_t>(255 - p->b), static_cast<std::uint8_t>(255 - p->g),
               static_cast<std::uint8_t>(255 - p->r), 255};
  return a;
}

TBitmap32 KernelGradientFilter(const TBitmap32& picture, const Kernel& k, Gradient gradient) {
  TBitmap32 out = ScratchPicture(picture.Width(), picture.Height());
  KernelGradientFilterInto(picture, k, gradient, out);
  return out;
}

void KernelGradientFilterInto(const TBitmap32& picture, const Kernel& k, Gradient gradient,
                              TBitmap32& out) {
  const int w = picture.Width();
  const int h = picture.Height();
  const auto taps = ShortTaps(k);
  if (!taps || w < 3 || h < 3) {
    out = KernelGradientReference(picture, k, gradient);
    return;
  }
  const int middleWeight = gradient == Gradient::LeftMinusRight ? 1 : 2;
  const int sign = gradient == Gradient::LeftMinusRight ? 1 : -1;
  const int bytes = w * 4;
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * (taps->size() + 8), [&](int y0, int y1) {
    std::int16_t kernelSums[kSumChunk];
    std::int16_t gradientSums[kSumChunk];
    for (int y = y0; y < y1; ++y) {
      const std::uint8_t* rows[3] = {
          reinterpret_cast<const std::uint8_t*>(picture.ScanLine(y - 1)),
          reinterpret_cast<const std::uint8_t*>(picture.ScanLine(y)),
          reinterpret_cast<const std::uint8_t*>(picture.ScanLine(y + 1))};
      Pixel* row = out.ScanLine(y);
      auto* dst = reinterpret_cast<std::uint8_t*>(row);
      for (int first = 4; first < bytes - 4; first += kSumChunk) {
        const int count = std::min(kSumChunk, bytes - 4 - first);
        ShortSums(rows, first, count, *taps, kernelSums);
        GradientSums(rows, first, count, middleWeight, sign, gradientSums);
        // The clamp is monotonic, so the larger clamped response is the clamped larger one;
        // the result is stored inverted at once.
        for (int i = 0; i < count; ++i)
          dst[first + i] =
              static_cast<std::uint8_t>(255 - ClampShort(std::max(kernelSums[i], gradientSums[i])));
      }
      for (int x = 1; x < w - 1; ++x) row[x].a = 255;
      row[0] = row[1];
      row[w - 1] = row[w - 2];
    }
  });
  const std::size_t rowBytes = static_cast<std::size_t>(w) * sizeof(Pixel);
  std::memcpy(out.ScanLine(0), out.ScanLine(1), rowBytes);
  std::memcpy(out.ScanLine(h - 1), out.ScanLine(h - 2), rowBytes);
}

}  // namespace quillane
