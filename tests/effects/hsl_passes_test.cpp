// HSL adjust, texture and colour pencil in their fast banded passes against the plain
// conversions, with many bands on small pictures and with the AVX2 variants on and off.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "data/texture_tiles.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/paint/color_pencil.h"
#include "effects/surface/texture.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

// Soft gradients with grain: edge maps with mid-range grays and their exact halves, and the
// colours near gray where hue and saturation meet exact halves most.
TBitmap32 SoftPicture(int w, int h, unsigned seed) {
  std::mt19937 rng(seed);
  TBitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto channel = [&](int slope) {
        return static_cast<std::uint8_t>(ClampByte(90 + slope * (x + 2 * y) % 110 + rng() % 9));
      };
      b.At(x, y) = Pixel{channel(1), channel(2), channel(3), static_cast<std::uint8_t>(rng())};
    }
  return b;
}

struct Variant {
  RowSplit split;
  bool avx2;
};
constexpr Variant kVariants[] = {{{1, kParallelThreshold}, true}, {{7, 1}, true}, {{5, 1}, false}};

// Splits rows as given, with or without the AVX2 variants, while it lives.
class Using {
 public:
  explicit Using(const Variant& v) {
    SetRowSplit(v.split);
    SetAvx2Allowed(v.avx2);
  }
  ~Using() {
    SetRowSplit({});
    SetAvx2Allowed(true);
  }
};

// Widths around the vector steps (8, 16, 32 pixels), the row chunk (256) and the edge stretch
// (512 interior pixels); heights below the number of bands.
constexpr std::pair<int, int> kSizes[] = {{1, 1},  {1, 9},   {9, 1},   {2, 5},   {3, 3},  {17, 4},
                                          {33, 6}, {40, 23}, {259, 3}, {515, 2}, {516, 5}};

TBitmap32 Picture(int w, int h, unsigned seed) {
  return seed % 2 == 0 ? SoftPicture(w, h, seed) : RandomPicture(w, h, seed, true);
}

TEST(HslPasses, ColourPencilEqualsThePlainSteps) {
  unsigned seed = 0;
  for (const Variant& v : kVariants)
    for (const auto& [w, h] : kSizes) {
      const TBitmap32 source = Picture(w, h, ++seed);
      for (int pressure : {0, 45, 70}) {
        const TBitmap32 expected = ColorSketchReference(source, pressure);
        const Using using_(v);
        ASSERT_EQ(colorsketch(source, pressure), expected)
            << w << "x" << h << " p=" << pressure << " avx2=" << v.avx2;
      }
    }
}

TEST(HslPasses, TextureEqualsThePlainConversions) {
  unsigned seed = 100;
  for (const Variant& v : kVariants)
    for (const auto& [w, h] : kSizes)
      for (int pressure : {0, 37, 100}) {
        const TBitmap32 base = Picture(w + 60, h, ++seed);
        const TBitmap32& tile = TextureTile(static_cast<int>(seed % 15) + 1);
        const TBitmap32 expected = TextureReference(base, tile, pressure);
        const Using using_(v);
        ASSERT_EQ(texture(base, tile, pressure), expected) << w << "x" << h << " p=" << pressure;
      }
}

TEST(HslPasses, HslAdjustEqualsThePlainConversions) {
  unsigned seed = 200;
  for (const Variant& v : kVariants)
    for (const auto& [w, h] : kSizes) {
      const TBitmap32 in = Picture(w, h, ++seed);
      for (const auto [hue, s, l] : {std::array{180, 100, 100}, {17, 163, 41}, {360, 0, 200}}) {
        TBitmap32 expected(w, h);
        for (int y = 0; y < h; ++y)
          for (int x = 0; x < w; ++x) {
            const Pixel p = in.At(x, y);
            const Hsl c = RgbToHslReference(p.r, p.g, p.b);
            const Rgb o =
                HslToRgbReference((c.h + hue + 180) % 360, std::clamp(c.s + s - 100, 0, 100),
                                  std::clamp(c.l + l - 100, 0, 100));
            expected.At(x, y) =
                Pixel{static_cast<std::uint8_t>(o.b), static_cast<std::uint8_t>(o.g),
                      static_cast<std::uint8_t>(o.r), 255};
          }
        const Using using_(v);
        ASSERT_EQ(HslAdjust(in, hue, s, l), expected) << w << "x" << h << " " << hue;
      }
    }
}

TEST(HslPasses, EdgeGrayRowsAreTheGrayOfTheEdgeMap) {
  unsigned seed = 300;
  for (bool avx2 : {true, false})
    for (const auto& [w, h] : {std::pair{3, 3}, {4, 5}, {35, 4}, {514, 3}, {547, 4}}) {
      const TBitmap32 source = Picture(w, h, ++seed);
      const TBitmap32 edges = PicsobelReference(source);
      SetAvx2Allowed(avx2);
      std::vector<std::uint8_t> gray(static_cast<std::size_t>(w));
      for (int y = 0; y < h; ++y) {
        GrayEdgeRow(source, y, gray.data());
        for (int x = 0; x < w; ++x) {
          const Pixel e = edges.At(x, y);
          ASSERT_EQ(gray[static_cast<std::size_t>(x)], GrayValue(e.r, e.g, e.b))
              << w << "x" << h << " " << x << "," << y << " avx2=" << avx2;
        }
      }
      SetAvx2Allowed(true);
    }
}

}  // namespace
}  // namespace quillane
