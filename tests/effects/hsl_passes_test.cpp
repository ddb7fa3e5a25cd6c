// HSL adjust, texture and colour pencil in their fast banded passes against the plain
// conversions, with many bands on small pictures and with the AVX2 variants on and off.
#include <gtest/gtest.h>

#include <algorithm>

#include "data/texture_tiles.h"
#include "effects/adjust/hsl_adjust.h"
#include "effects/paint/color_pencil.h"
#include "effects/surface/texture.h"
#include "imaging/tone.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/imaging_reference.h"
#include "tests/reference/paint_reference.h"
#include "tests/reference/surface_reference.h"

namespace quillane {
namespace {

Bitmap32 Picture(int w, int h, unsigned seed) {
  return seed % 2 == 0 ? SoftPicture(w, h, seed) : RandomPicture(w, h, seed, true);
}

TEST(HslPasses, ColourPencilEqualsThePlainSteps) {
  unsigned seed = 0;
  for (const auto& [w, h] : kAwkwardSizes) {
    const Bitmap32 source = Picture(w, h, ++seed);
    for (int pressure : {0, 45, 70}) {
      const Bitmap32 expected = ColorSketchReference(source, pressure);
      ForEachSplit([&] {
        ASSERT_EQ(ColorPencil(source, pressure), expected) << w << "x" << h << " p=" << pressure;
      });
    }
  }
}

TEST(HslPasses, TextureEqualsThePlainConversions) {
  unsigned seed = 100;
  for (const auto& [w, h] : kAwkwardSizes)
    for (int pressure : {0, 37, 100}) {
      const Bitmap32 base = Picture(w + 60, h, ++seed);
      const Bitmap32& tile = TextureTile(static_cast<int>(seed % 15) + 1);
      const Bitmap32 expected = TextureReference(base, tile, pressure);
      ForEachSplit([&] {
        ASSERT_EQ(texture(base, tile, pressure), expected) << w << "x" << h << " p=" << pressure;
      });
    }
}

TEST(HslPasses, HslAdjustEqualsThePlainConversions) {
  EXPECT_TRUE(HslAdjust(Bitmap32(), 0, 200, 0).Empty());
  unsigned seed = 200;
  for (const auto& [w, h] : kAwkwardSizes) {
    const Bitmap32 in = Picture(w, h, ++seed);
    for (const auto [hue, s, l] :
         {std::array{180, 100, 100}, {17, 163, 41}, {360, 0, 200}, {0, 200, 0}, {359, 37, 160}}) {
      Bitmap32 expected(w, h);
      for (int y = 0; y < h; ++y)
        for (int x = 0; x < w; ++x) {
          const Pixel p = in.At(x, y);
          const Hsl c = RgbToHslReference(p.r, p.g, p.b);
          const Rgb o =
              HslToRgbReference((c.h + hue + 180) % 360, std::clamp(c.s + s - 100, 0, 100),
                                std::clamp(c.l + l - 100, 0, 100));
          expected.At(x, y) = Pixel{static_cast<std::uint8_t>(o.b), static_cast<std::uint8_t>(o.g),
                                    static_cast<std::uint8_t>(o.r), 255};
        }
      ForEachSplit(
          [&] { ASSERT_EQ(HslAdjust(in, hue, s, l), expected) << w << "x" << h << " " << hue; });
    }
  }
}

}  // namespace
}  // namespace quillane
