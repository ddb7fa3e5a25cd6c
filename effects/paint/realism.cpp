#include "effects/paint/realism.h"

#include <algorithm>
#include <cstring>

#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"

namespace quillane {
namespace {

std::uint8_t ClampWide(std::int64_t v) {
  return static_cast<std::uint8_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
}

}  // namespace

Bitmap32 ConvolvePlain(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor) {
  Bitmap32 out = picture;
  const std::int64_t d = divisor == 0 ? 1 : divisor;
  for (int y = 1; y < picture.Height() - 1; ++y) {
    for (int x = 1; x < picture.Width() - 1; ++x) {
      for (std::uint8_t Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
        std::int64_t s = 0;
        for (int t = 0; t < 9; ++t)
          s += k[static_cast<std::size_t>(t)] * picture.At(x + t % 3 - 1, y + t / 3 - 1).*c;
        out.At(x, y).*c = ClampWide(s / d);
      }
      out.At(x, y).a = 255;
    }
  }
  return out;
}

Bitmap32 Convolve(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor) {
  Bitmap32 out = ScratchPicture(picture.Width(), picture.Height());
  ConvolveInto(picture, k, divisor, out);
  return out;
}

void ConvolveInto(const Bitmap32& picture, const Kernel& k, std::uint16_t divisor, Bitmap32& out) {
  const int w = picture.Width();
  const int h = picture.Height();
  // Kernels too heavy for 32-bit sums, and divisors other than 1, are rare: they take the
  // plain way.
  const auto pass = divisor > 1 ? std::nullopt : KernelRowPass::Make(k, std::nullopt);
  if (!pass) {
    out = ConvolvePlain(picture, k, divisor);
    return;
  }
  if (w == 0 || h == 0) return;
  const std::size_t rowBytes = static_cast<std::size_t>(w) * sizeof(Pixel);
  if (w < 3 || h < 3) {
    std::memcpy(out.Data(), picture.Data(), rowBytes * static_cast<std::size_t>(h));
    return;
  }
  // One pass over bands of rows: each output row is written once, from three source rows
  // that are still in the cache from the row before.
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * 8, [&](int y0, int y1) {
    if (y0 == 1) std::memcpy(out.ScanLine(0), picture.ScanLine(0), rowBytes);
    for (int y = y0; y < y1; ++y) {
      const Pixel* source = picture.ScanLine(y);
      Pixel* row = out.ScanLine(y);
      pass->Row(picture.ScanLine(y - 1), source, picture.ScanLine(y + 1), w, row);
      row[0] = source[0];
      row[w - 1] = source[w - 1];
    }
    if (y1 == h - 1) std::memcpy(out.ScanLine(h - 1), picture.ScanLine(h - 1), rowBytes);
    KernelRowPass::EndBand();
  });
}

Bitmap32 realism(const Bitmap32& source, const Kernel& k) {
  return Convolve(source, k, 1);
}

const EffectSpec& RealismEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 2,
      .menuEntry = "Realism",
      .menuObjectName = "Realism1",
      .windowObjectName = "TFormOfFringe1",
      .caption = "Setup for Realism",
      .statusText = "Realism",
      .cliName = "realism",
      .batchTag = "Realism",
      .collapsedHeight = 157,
      .expandedHeight = 240,
      .batchPushesHistory = true,
      .apply = {"Button1", "Convert", "Convert with this setup"},
      .restoreDefaults = {"Button3", "Default", "Default setup"},
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              KernelParam({1, 2, 1, 0, 0, 0, -1, -1, -1}),
          },
      .reference = {.hash = 0xf59929b4aacceff2,
                    .topLeft = 0x88522e,
                    .centre = 0xaaa294,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            return realism(in.source, KernelFrom(in.params.GetList("kernel")));
          },
  };
  return entry;
}

}  // namespace quillane
