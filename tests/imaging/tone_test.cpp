#include "imaging/tone.h"

#include <gtest/gtest.h>

#include <vector>

namespace quillane {
namespace {

TEST(HslToRgb, Examples) {
  // {h, s, l, r, g, b}: pure hues (the ramps round halves to even), saturation and lightness
  // blends, then inputs out of range, which give black. These pin the plain conversion, which
  // the fast one is compared with on every input.
  const int cases[][6] = {{0, 100, 50, 255, 0, 0},    {60, 100, 50, 255, 255, 0},
                          {61, 100, 50, 251, 255, 0}, {359, 100, 50, 255, 0, 4},
                          {2, 100, 50, 255, 8, 0},    {0, 0, 50, 128, 128, 128},
                          {0, 50, 75, 224, 160, 160}, {0, 50, 25, 96, 32, 32},
                          {360, 100, 50, 0, 0, 0},    {-1, 50, 50, 0, 0, 0}};
  for (const auto& c : cases)
    EXPECT_EQ(HslToRgb(c[0], c[1], c[2]), (Rgb{c[3], c[4], c[5]}))
        << c[0] << "," << c[1] << "," << c[2];
}

TEST(RgbToHsl, Examples) {
  EXPECT_EQ(RgbToHsl(255, 0, 0), (Hsl{0, 100, 50}));
  EXPECT_EQ(RgbToHsl(200, 200, 200), (Hsl{0, 0, 78}));
  EXPECT_EQ(RgbToHsl(10, 20, 30), (Hsl{210, 50, 8}));
  // h is just below a full turn and rounds to 360, reported as 0.
  EXPECT_EQ(RgbToHsl(255, 0, 1), (Hsl{0, 100, 50}));
  // (0, 1, 8) has the hue 232.5 in exact arithmetic. The double fraction h times 360 taken in
  // extended precision lands just above the half (a double product would land on it and round
  // to 232), so this pins the precision in which the conversion is carried out.
  EXPECT_EQ(RgbToHsl(0, 1, 8).h, 233);
}

TEST(LightnessContrast, TableOfPositions) {
  const int ls[] = {0, 10, 25, 50, 55, 75, 90, 94, 95, 100};
  const std::vector<std::pair<int, std::vector<int>>> rows = {
      {10, {80, 82, 85, 89, 90, 94, 96, 97, 97, 98}},
      {30, {38, 44, 53, 67, 70, 82, 90, 93, 93, 96}},
      {44, {3, 13, 27, 51, 56, 75, 90, 94, 95, 99}},
      {60, {0, 0, 0, 24, 33, 67, 93, 100, 100, 100}},
  };
  for (const auto& [c, expected] : rows)
    for (std::size_t i = 0; i < expected.size(); ++i)
      EXPECT_EQ(LightnessContrast(ls[i], c), expected[i]) << "c=" << c << " L=" << ls[i];
  for (int l = 0; l <= 100; ++l) {
    EXPECT_EQ(LightnessContrast(l, 0), 100);
    EXPECT_EQ(LightnessContrast(l, 45), l);
    EXPECT_EQ(LightnessContrast(l, 89), l <= 93 ? 0 : (l == 94 ? 50 : 100)) << l;
  }
}

Pixel Gray(int v, int alpha = 255) {
  const auto g = static_cast<std::uint8_t>(v);
  return Pixel{g, g, g, static_cast<std::uint8_t>(alpha)};
}

TEST(PencilContrastPass, GrayLevelsAtNeutralPosition) {
  const int levels[][2] = {{0, 0},     {1, 0},     {2, 3},     {127, 128},
                           {129, 131}, {200, 199}, {254, 255}, {255, 255}};
  Bitmap32 ramp(8, 2);
  for (int x = 0; x < 8; ++x) ramp.At(x, 0) = ramp.At(x, 1) = Gray(levels[x][0], 7);
  const Bitmap32 result = PencilContrastPass(ramp, 45);
  for (int x = 0; x < 8; ++x) EXPECT_EQ(result.At(x, 1), Gray(levels[x][1])) << levels[x][0];
  EXPECT_TRUE(PencilContrastPass(Bitmap32(), 45).Empty());
  // A single row is an ordinary picture here.
  EXPECT_EQ(PencilContrastPass(Bitmap32(4, 1, Pixel{0, 0, 0, 0}), 45), Bitmap32(4, 1, Gray(0)));
}

}  // namespace
}  // namespace quillane
