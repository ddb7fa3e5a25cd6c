// The gray and tint row kernels against their plain forms, with and without AVX2, at every
// alignment of the result and lengths around the vector step. (The stripe kernel is compared
// through stria with its plain form in the effects' tests.)
#include "imaging/colour_rows.h"

#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "imaging/gray_row.h"
#include "imaging/numeric.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

// Alpha 0, 255 or anything.
std::vector<Pixel> Pixels(int n, unsigned seed) {
  std::mt19937 rng(seed);
  std::vector<Pixel> p(static_cast<std::size_t>(n));
  for (Pixel& q : p) {
    const std::uint32_t v = rng();
    const std::uint8_t alphas[4] = {0, 255, 255, static_cast<std::uint8_t>(v >> 24)};
    q = Pixel{static_cast<std::uint8_t>(v), static_cast<std::uint8_t>(v >> 8),
              static_cast<std::uint8_t>(v >> 16), alphas[rng() % 4]};
  }
  return p;
}

TEST(GrayRow, EveryColourHasItsGrayValue) {
  // One row per red level, holding every green and blue level.
  std::vector<Pixel> in(65536), out(65536);
  ForEachVectorWidth([&] {
    for (int r = 0; r < 256; ++r) {
      for (int i = 0; i < 65536; ++i)
        in[static_cast<std::size_t>(i)] =
            Pixel{static_cast<std::uint8_t>(i), static_cast<std::uint8_t>(i >> 8),
                  static_cast<std::uint8_t>(r), 0};
      GrayRowInto(in.data(), out.data(), 65536, 0);
      for (int i = 0; i < 65536; ++i) {
        const std::uint8_t v = GrayValue(r, i >> 8, i & 0xFF);
        ASSERT_EQ(out[static_cast<std::size_t>(i)], (Pixel{v, v, v, 255}))
            << "r " << r << " g " << (i >> 8) << " b " << (i & 0xFF);
      }
    }
  });
}

TEST(GrayRow, RaisedChannelsAtEveryAlignmentAndLength) {
  const std::vector<Pixel> in = Pixels(80, 1);
  ForEachVectorWidth([&] {
    for (const std::uint32_t set : {0x00FF0000u, 0x0000FFFFu, 0x00FF00FFu})
      for (int offset = 0; offset < 8; ++offset)
        for (int n = 0; n <= 40; ++n) {
          std::vector<Pixel> fast(56, Pixel{1, 2, 3, 4}), plain = fast;
          GrayRowInto(in.data() + offset, fast.data() + offset, n, set);
          GrayRowIntoReference(in.data() + offset, plain.data() + offset, n, set);
          ASSERT_EQ(fast, plain) << "offset " << offset << " n " << n;
        }
  });
}

TEST(TintRow, EqualsTintedPixelByPixel) {
  const ChannelTint tints[] = {{.set = 0x00FF0000},
                               {.add = 0x00007800, .sub = 0x00780078},
                               {.add = 0x00505000, .clear = 0xFF0000FF},
                               {.add = 0x00000032, .set = 0x0000FF00}};
  const std::vector<Pixel> in = Pixels(100, 2), alphas = Pixels(50, 3);
  ForEachVectorWidth([&] {
    for (const ChannelTint& tint : tints)
      for (const int stride : {1, 2})
        for (const bool withAlpha : {false, true})
          for (int offset = 0; offset < 8; ++offset)
            for (int n = 0; n <= 40; ++n) {
              std::vector<Pixel> out(48);
              TintRow(in.data(), stride, withAlpha ? alphas.data() : nullptr, out.data() + offset,
                      n, tint);
              for (int x = 0; x < n; ++x) {
                Pixel want = Tinted(in[static_cast<std::size_t>(stride * x)], tint);
                if (withAlpha) want.a = alphas[static_cast<std::size_t>(x)].a;
                ASSERT_EQ(out[static_cast<std::size_t>(offset + x)], want)
                    << "x " << x << " n " << n << " stride " << stride;
              }
            }
  });
}

}  // namespace
}  // namespace quillane
