// The banded kernel and emboss passes, with and without AVX2, against their plain references.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "effects/paint/abstract.h"
#include "effects/paint/kernel_gradient.h"
#include "effects/paint/pop_art.h"
#include "effects/paint/realism.h"
#include "effects/surface/emboss.h"
#include "imaging/numeric.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/surface_reference.h"

namespace quillane {
namespace {

// Black and white in stripes and checks: the largest sums of either sign.
Bitmap32 Extremes(int w, int h) {
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto v = static_cast<std::uint8_t>((x + y) % 2 * 255);
      b.At(x, y) = Pixel{v, static_cast<std::uint8_t>(y % 2 * 255), 255, v};
    }
  return b;
}

TEST(KernelFastPath, EqualsTheReferencesAtAwkwardSizes) {
  // Defaults, pairs of weights at the byte limits, a lone 128, kernels beyond 16 bits and at
  // the edge of 32 (255 times their magnitudes is 2^31 - 128).
  const Kernel kernels[] = {{1, 2, 1, 0, 0, 0, -1, -1, -1},
                            {-1, -1, -1, 0, 0, 0, -1, -1, -1},
                            {-1, -2, -1, 0, 0, 0, 1, 2, 1},
                            {-128},
                            {127, 0, 1},
                            {0, 64, 0, 0, 0, 0, 0, 64},
                            {0, 0, 0, 0, -64, 0, 0, -64},
                            {0, 0, 0, 0, 128},
                            {3, -17, 9, 40, -5, 11, -2, 30, 8},
                            {200, 0, 0, 0, -90},
                            {8421504},
                            {-4210752, 0, 0, 0, 0, 0, 0, 0, -4210752}};
  ForEachSplit([&] {
    unsigned seed = 0;
    for (const auto& [w, h] : kAwkwardSizes)
      for (const Bitmap32& in : {RandomPicture(w, h, ++seed), Extremes(w, h)})
        for (const Kernel& k : kernels) {
          SCOPED_TRACE(::testing::Message() << w << "x" << h << " k0 " << k[0]);
          ASSERT_EQ(realism(in, k), ConvolvePlain(in, k, 1));
          ASSERT_EQ(Abstract(in, k), KernelGradientPlain(in, k, Gradient::LeftMinusRight));
          ASSERT_EQ(PopArt(in, k), KernelGradientPlain(in, k, Gradient::RightMinusLeftSobel));
        }
  });
}

TEST(EmbossFastPath, EqualsTheReferenceAtAwkwardSizes) {
  ForEachSplit([] {
    for (const auto& [w, h] : kAwkwardSizes)
      for (int depth : {1, 2, 5})
        // The window's lightings, and beyond them those the byte arithmetic cannot take.
        for (int lighting : {0, 100, 200, 205, -51, 206}) {
          const Bitmap32 in = RandomPicture(w + depth, h + depth, static_cast<unsigned>(w + h));
          ASSERT_EQ(emboss(in, lighting, depth), EmbossReference(in, lighting, depth))
              << w << "x" << h << " depth " << depth << " " << lighting;
        }
  });
}

// Every relief byte for lightings across the range the byte arithmetic takes, and the gray
// value of every colour, exact halves included: the same as the plain variant's formula. Even rows
// are P, odd rows Q: output row 2j, pixel x, is the relief of P(x, 2j) against Q(x + 1, 2j + 1).
TEST(EmbossFastPath, EveryReliefByteAndEveryGrayValueAsThePlainVariant) {
  Bitmap32 in(257, 512);
  const auto fill = [&in](const auto& p, const auto& q) {
    for (int j = 0; j < 256; ++j)
      for (int x = 0; x < 256; ++x) {
        in.ScanLine(2 * j)[x] = p(x, j);
        in.ScanLine(2 * j + 1)[x + 1] = q(x, j);
      }
  };
  const auto same = [&in](int lighting) {
    const Bitmap32 fast = emboss(in, lighting, 1);
    const FastPathVariant plain(VectorWidth::Plain);
    return fast == emboss(in, lighting, 1);
  };
  const auto gray = [](int v) {
    const auto g = static_cast<std::uint8_t>(v);
    return Pixel{g, g, g, 0};
  };
  fill([&](int x, int) { return gray(x); }, [&](int, int j) { return gray(j); });
  for (int lighting : {-50, -49, 0, 77, 100, 200, 204, 205})
    ASSERT_TRUE(same(lighting)) << lighting;
  // With lighting 200 and P = 5, a Q of 255 - v gives the relief v.
  for (int r = 0; r < 256; ++r) {
    fill(
        [](int, int) {
          return Pixel{5, 5, 5, 0};
        },
        [r](int b, int g) {
          return Pixel{static_cast<std::uint8_t>(255 - b), static_cast<std::uint8_t>(255 - g),
                       static_cast<std::uint8_t>(255 - r), 0};
        });
    ASSERT_TRUE(same(200)) << r;
  }
}

}  // namespace
}  // namespace quillane
