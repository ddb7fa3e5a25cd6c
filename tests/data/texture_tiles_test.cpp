#include "data/texture_tiles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "imaging/tone.h"

namespace quillane {
namespace {

struct Expected {
  int min;
  double mean;
  int max;
};
constexpr Expected kLightness[kTextureTiles] = {
    {9, 68.3, 100}, {24, 67.9, 100}, {20, 63.3, 91}, {12, 67.2, 100}, {0, 56.9, 100},
    {0, 64.3, 95},  {0, 68.2, 97},   {5, 62.3, 93},  {0, 69.4, 100},  {5, 66.9, 99},
    {19, 55.9, 99}, {23, 58.8, 100}, {38, 68.5, 93}, {23, 49.2, 77},  {32, 46.5, 90}};

// Seamless: the step across the wrap, from the last column to the first (row likewise), is
// no larger than the tile's usual step between neighbours.
TEST(TextureTiles, AreGrayWithTheirLightnessAndRepeatWithoutSeams) {
  for (int n = 1; n <= kTextureTiles; ++n) {
    SCOPED_TRACE(n);
    const Bitmap32 tile = TextureTile(n);
    ASSERT_EQ(tile.Width(), 58);
    ASSERT_EQ(tile.Height(), 58);
    int lo = 100, hi = 0;
    double sum = 0, across = 0, wrap = 0;
    for (int y = 0; y < 58; ++y)
      for (int x = 0; x < 58; ++x) {
        const Pixel p = tile.At(x, y);
        ASSERT_TRUE(p.r == p.g && p.g == p.b && p.a == 255);
        const int l = RgbToHsl(p.r, p.g, p.b).l;
        lo = std::min(lo, l);
        hi = std::max(hi, l);
        sum += l;
        const int right = std::abs(p.r - tile.At((x + 1) % 58, y).r);
        const int down = std::abs(p.r - tile.At(x, (y + 1) % 58).r);
        across += right + down;
        if (x == 57) wrap += right;
        if (y == 57) wrap += down;
      }
    EXPECT_EQ(lo, kLightness[n - 1].min);
    EXPECT_EQ(hi, kLightness[n - 1].max);
    EXPECT_NEAR(sum / (58 * 58), kLightness[n - 1].mean, 0.5);
    EXPECT_LE(wrap / (2 * 58), 1.5 * across / (2 * 58 * 58));
  }
  EXPECT_THROW(TextureTile(0), std::out_of_range);
  EXPECT_THROW(TextureTile(16), std::out_of_range);
}

}  // namespace
}  // namespace quillane
