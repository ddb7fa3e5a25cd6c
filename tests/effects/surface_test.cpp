// Emboss, texture and stria on small crafted pictures, and against their plain formulas.
#include <gtest/gtest.h>

#include <array>
#include <cstdlib>

#include "data/texture_tiles.h"
#include "effects/surface/emboss.h"
#include "effects/surface/stria.h"
#include "effects/surface/texture.h"
#include "imaging/numeric.h"
#include "imaging/tone.h"
#include "tests/imaging/random_picture.h"
#include "tests/reference/surface_reference.h"

namespace quillane {
namespace {

Pixel Gray(int v) {
  const auto g = static_cast<std::uint8_t>(v);
  return Pixel{g, g, g, 255};
}

// The relief formula exactly as stated, in place from the top row down.
Bitmap32 PlainEmboss(Bitmap32 b, int lighting, int depth) {
  for (int y = 0; y <= b.Height() - depth - 1; ++y)
    for (int x = 0; x <= b.Width() - depth - 1; ++x) {
      const Pixel p = b.At(x, y), q = b.At(x + depth, y + depth);
      const auto v = [&](int pc, int qc) {
        return std::min(255, std::abs(pc - qc + lighting + 50));
      };
      const Extended sum = 0.3L * v(p.r, q.r) + 0.59L * v(p.g, q.g) + 0.11L * v(p.b, q.b);
      b.At(x, y) = Gray(Round(sum));
    }
  return b;
}

// The formula leaves the rightmost and bottom depth pixels as they were; pictures no larger
// than depth in either direction come back unchanged.
TEST(Emboss, MatchesTheFormulaOnRandomPicturesOfEverySize) {
  for (int depth = 1; depth <= 5; ++depth)
    for (int lighting : {0, 37, 100, 200})
      for (auto [w, h] :
           {std::pair{41, 13}, {depth, 7}, {7, depth}, {depth + 1, 2}, {1, 1}, {0, 0}}) {
        const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(depth * 1000 + lighting));
        ASSERT_EQ(emboss(in, lighting, depth), PlainEmboss(in, lighting, depth))
            << depth << " " << lighting << " " << w << "x" << h;
      }
  const Bitmap32 in = RandomPicture(6, 6, 1);
  EXPECT_EQ(emboss(in, 100, 3).At(5, 0), in.At(5, 0));
}

// The stripe layer built pixel by pixel and composited with DrawOver.
Bitmap32 PlainStria(const Bitmap32& base, int w, int h, StriaDirection direction, int t, int g,
                    int transparency, std::uint32_t colour) {
  Bitmap32 layer(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const int m = (direction == StriaDirection::Vertical ? x : y) % (t + g);
      layer.At(x, y) =
          m < t ? PixelFromColorRef(colour, static_cast<std::uint8_t>(255 - transparency))
                : Pixel{255, 255, 255, 0};
    }
  Bitmap32 out = base;
  layer.DrawOver(0, 0, out);
  return out;
}

TEST(Stria, StripesStartAtTheFirstColumnOrRow) {
  const Bitmap32 white(7, 2, Gray(255));
  const Bitmap32 dark = stria(white, 7, 2, StriaDirection::Vertical, 1, 2, 128, 0);
  for (int x = 0; x < 7; ++x) EXPECT_EQ(dark.At(x, 1), Gray(x % 3 == 0 ? 128 : 255)) << x;
  // Thickness 100 and space 1 leave every 101st column.
  const Bitmap32 wide =
      stria(Bitmap32(203, 1, Gray(255)), 203, 1, StriaDirection::Vertical, 100, 1, 0, 0);
  for (int x = 0; x < 203; ++x) EXPECT_EQ(wide.At(x, 0).r, x == 100 || x == 201 ? 255 : 0) << x;
  // A single row is a stripe row.
  EXPECT_EQ(stria(Bitmap32(3, 1, Gray(255)), 3, 1, StriaDirection::Horizontal, 1, 2, 0, 0),
            Bitmap32(3, 1, Gray(0)));
}

// Transparent base pixels take stripes unblended and gaps as transparent white; a base larger
// than the layer keeps its excess, a smaller one is striped where both lie.
TEST(Stria, MatchesTheCompositedLayerOnEveryAlphaAndSize) {
  for (StriaDirection d : {StriaDirection::Vertical, StriaDirection::Horizontal})
    for (int transparency : {0, 1, 128, 254, 255})
      for (auto [w, h, lw, lh] : {std::array{29, 17, 29, 17},
                                  {29, 17, 20, 9},
                                  {9, 5, 20, 12},
                                  {1, 6, 1, 6},
                                  {6, 2, 6, 2},
                                  {0, 0, 0, 0}}) {
        Bitmap32 base = RandomPicture(w, h, static_cast<unsigned>(transparency * 7 + w));
        for (int y = 0; y < h; ++y)
          for (int x = 0; x < w; ++x) base.At(x, y).a = (x + y) % 3 == 0 ? base.At(x, y).a : 255;
        if (w > 0) base.At(0, 0).a = 0;
        ASSERT_EQ(stria(base, lw, lh, d, 3, 2, transparency, 0x123456),
                  PlainStria(base, lw, lh, d, 3, 2, transparency, 0x123456))
            << static_cast<int>(d) << " " << transparency << " " << w << "x" << h;
      }
}

// One base pixel under one tile pixel of gray t.
TEST(Texture, MovesTheLightnessByTheTileAndThePressure) {
  const auto under = [](Pixel base, int t, int pressure) {
    return texture(Bitmap32(1, 1, base), Bitmap32(1, 1, Gray(t)), pressure).At(0, 0);
  };
  const auto fromHsl = [](int l) {
    const Rgb c = HslToRgb(0, 0, l);
    return Pixel{static_cast<std::uint8_t>(c.b), static_cast<std::uint8_t>(c.g),
                 static_cast<std::uint8_t>(c.r), 255};
  };
  const Pixel red{100, 100, 200, 255};
  EXPECT_EQ(under(red, 179, 50), (Pixel{101, 101, 201, 255}));  // neutral: the round trip
  EXPECT_EQ(under(red, 230, 50), (Pixel{176, 176, 227, 255}));  // lightness 90: +20
  EXPECT_EQ(under(Gray(128), 255, 100), Gray(255));             // limited to 100
  EXPECT_EQ(under(Gray(128), 0, 100), Gray(0));
  // Pressure 25: shifts of 0.5, 1.5 and -0.5 round half to even.
  EXPECT_EQ(under(Gray(128), 181, 25), fromHsl(50));
  EXPECT_EQ(under(Gray(128), 186, 25), fromHsl(52));
  EXPECT_EQ(under(Gray(128), 176, 25), fromHsl(50));
}

// Smaller pictures take the tile's top-left part, larger ones repeat it from the corner.
TEST(Texture, MatchesThePlainConversionsOnEverySize) {
  for (int n : {1, 5, 14})
    for (int pressure : {0, 25, 50, 100})
      for (auto [w, h] : {std::pair{130, 61}, {40, 3}, {1, 59}, {59, 1}, {1, 1}, {0, 0}}) {
        const Bitmap32 base = RandomPicture(w, h, static_cast<unsigned>(n * 131 + pressure));
        ASSERT_EQ(texture(base, TextureTile(n), pressure),
                  TextureReference(base, TextureTile(n), pressure))
            << n << " " << pressure << " " << w << "x" << h;
      }
}

}  // namespace
}  // namespace quillane
