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

std::int64_t WeightedSum(const Bitmap32& picture, const Kernel& k, int x, int y,
                         std::uint8_t Pixel::*c) {
  std::int64_t s = 0;
  for (int t = 0; t < 9; ++t)
    s += k[static_cast<std::size_t>(t)] * picture.At(x + t % 3 - 1, y + t / 3 - 1).*c;
  return s;
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

Bitmap32 KernelGradientPlain(const Bitmap32& picture, const Kernel& k, Gradient gradient) {
  const Kernel g = GradientKernel(gradient);
  Bitmap32 a = picture;
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

Bitmap32 KernelGradientFilter(const Bitmap32& picture, const Kernel& k, Gradient gradient) {
  Bitmap32 out = ScratchPicture(picture.Width(), picture.Height());
  KernelGradientFilterInto(picture, k, gradient, out);
  return out;
}

void KernelGradientFilterInto(const Bitmap32& picture, const Kernel& k, Gradient gradient,
                              Bitmap32& out) {
  const int w = picture.Width();
  const int h = picture.Height();
  const auto pass = KernelRowPass::Make(
      k, gradient == Gradient::LeftMinusRight ? ColumnGradient{1, 1} : ColumnGradient{2, -1});
  if (!pass || w < 3 || h < 3) {
    out = KernelGradientPlain(picture, k, gradient);
    return;
  }
  // One pass over bands of rows; the frame repeats the rows and pixels just made.
  const std::size_t rowBytes = static_cast<std::size_t>(w) * sizeof(Pixel);
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * 12, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = out.ScanLine(y);
      pass->Row(picture.ScanLine(y - 1), picture.ScanLine(y), picture.ScanLine(y + 1), w, row);
      row[0] = row[1];
      row[w - 1] = row[w - 2];
    }
    if (y0 == 1) std::memcpy(out.ScanLine(0), out.ScanLine(1), rowBytes);
    if (y1 == h - 1) std::memcpy(out.ScanLine(h - 1), out.ScanLine(h - 2), rowBytes);
    KernelRowPass::EndBand();
  });
}

}  // namespace quillane
