#include "imaging/tone.h"

#include <gtest/gtest.h>

#include <vector>

namespace quillane {
namespace {

TEST(HslToRgb, PureHueRampsRoundHalvesToEven) {
  EXPECT_EQ(HslToRgb(0, 100, 50), (Rgb{255, 0, 0}));
  EXPECT_EQ(HslToRgb(60, 100, 50), (Rgb{255, 255, 0}));
  EXPECT_EQ(HslToRgb(61, 100, 50), (Rgb{251, 255, 0}));
  EXPECT_EQ(HslToRgb(359, 100, 50), (Rgb{255, 0, 4}));
  EXPECT_EQ(HslToRgb(2, 100, 50), (Rgb{255, 8, 0}));
  EXPECT_EQ(HslToRgb(6, 100, 50), (Rgb{255, 26, 0}));
  EXPECT_EQ(HslToRgb(10, 100, 50), (Rgb{255, 42, 0}));
}

TEST(HslToRgb, OutOfRangeInputsGiveBlack) {
  EXPECT_EQ(HslToRgb(360, 100, 50), (Rgb{0, 0, 0}));
  EXPECT_EQ(HslToRgb(0, 101, 50), (Rgb{0, 0, 0}));
  EXPECT_EQ(HslToRgb(-1, 50, 50), (Rgb{0, 0, 0}));
  EXPECT_EQ(HslToRgb(0, 50, 101), (Rgb{0, 0, 0}));
}

TEST(HslToRgb, SaturationAndLightnessBlends) {
  EXPECT_EQ(HslToRgb(0, 0, 50), (Rgb{128, 128, 128}));
  EXPECT_EQ(HslToRgb(0, 0, 0), (Rgb{0, 0, 0}));
  EXPECT_EQ(HslToRgb(0, 0, 100), (Rgb{255, 255, 255}));
  EXPECT_EQ(HslToRgb(0, 50, 75), (Rgb{224, 160, 160}));
  EXPECT_EQ(HslToRgb(0, 50, 25), (Rgb{96, 32, 32}));
}

TEST(RgbToHsl, Examples) {
  EXPECT_EQ(RgbToHsl(255, 0, 0), (Hsl{0, 100, 50}));
  EXPECT_EQ(RgbToHsl(200, 200, 200), (Hsl{0, 0, 78}));
  EXPECT_EQ(RgbToHsl(10, 20, 30), (Hsl{210, 50, 8}));
  // h is just below a full turn and rounds to 360, reported as 0.
  EXPECT_EQ(RgbToHsl(255, 0, 1), (Hsl{0, 100, 50}));
}

// (0, 1, 8) has the hue 232.5 in exact arithmetic. The double fraction h times 360 taken in
// extended precision lands just above the half (a double product would land on it and round
// to 232), so this pins the precision in which the conversion is carried out.
TEST(RgbToHsl, ExactTieIsDecidedByDoubleFractionsInExtendedProduct) {
  EXPECT_EQ(RgbToHsl(0, 1, 8).h, 233);
}

TEST(HslRoundTrip, ShiftsSomeColoursByALevel) {
  const auto roundTrip = [](int r, int g, int b) {
    const Hsl hsl = RgbToHsl(r, g, b);
    return HslToRgb(hsl.h, hsl.s, hsl.l);
  };
  EXPECT_EQ(roundTrip(200, 200, 200), (Rgb{199, 199, 199}));
  EXPECT_EQ(roundTrip(200, 100, 100), (Rgb{201, 101, 101}));
  EXPECT_EQ(roundTrip(10, 20, 30), (Rgb{10, 20, 31}));
  const std::vector<Rgb> stable = {{0, 0, 0},     {255, 255, 255}, {128, 128, 128},
                                   {255, 0, 0},   {0, 255, 0},     {0, 0, 255},
                                   {255, 255, 0}, {0, 255, 255},   {255, 0, 255}};
  for (const Rgb& c : stable) EXPECT_EQ(roundTrip(c.r, c.g, c.b), c);
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

TBitmap32 GrayRamp(const std::vector<int>& levels) {
  TBitmap32 b(static_cast<int>(levels.size()), 2);
  for (int y = 0; y < 2; ++y)
    for (std::size_t x = 0; x < levels.size(); ++x) {
      const auto v = static_cast<std::uint8_t>(levels[x]);
      b.At(static_cast<int>(x), y) = Pixel{v, v, v, 7};
    }
  return b;
}

TEST(PencilContrastPass, GrayLevelsAtNeutralPosition) {
  const std::vector<int> in = {0, 1, 2, 127, 129, 200, 254, 255};
  const std::vector<int> out = {0, 0, 3, 128, 131, 199, 255, 255};
  const TBitmap32 result = PencilContrastPass(GrayRamp(in), 45);
  for (std::size_t x = 0; x < in.size(); ++x)
    EXPECT_EQ(result.At(static_cast<int>(x), 1),
              (Pixel{static_cast<std::uint8_t>(out[x]), static_cast<std::uint8_t>(out[x]),
                     static_cast<std::uint8_t>(out[x]), 255}))
        << "level " << in[x];
}

// Gray pixels take a table shortcut; it must agree with the conversion it stands for, and
// coloured pixels go the long way.
TEST(PencilContrastPass, GrayShortcutAgreesWithConversionAndColourIsConverted) {
  TBitmap32 b(256, 2);
  for (int x = 0; x < 256; ++x) {
    const auto v = static_cast<std::uint8_t>(x);
    b.At(x, 0) = Pixel{v, v, v, 255};
    b.At(x, 1) = Pixel{static_cast<std::uint8_t>(255 - x), v, static_cast<std::uint8_t>(x / 2), 0};
  }
  for (int c : {0, 10, 44, 45, 60, 89}) {
    const TBitmap32 r = PencilContrastPass(b, c);
    for (int y = 0; y < 2; ++y)
      for (int x = 0; x < 256; ++x) {
        const Pixel p = b.At(x, y);
        const Hsl hsl = RgbToHsl(p.r, p.g, p.b);
        const Rgb e = HslToRgb(hsl.h, hsl.s, LightnessContrast(hsl.l, c));
        const Pixel q = r.At(x, y);
        ASSERT_EQ(q, (Pixel{static_cast<std::uint8_t>(e.b), static_cast<std::uint8_t>(e.g),
                            static_cast<std::uint8_t>(e.r), 255}))
            << "c=" << c << " x=" << x << " y=" << y;
      }
  }
}

TEST(PencilContrastPass, PositionZeroWhitensAndInputIsUntouched) {
  TBitmap32 b(3, 1, Pixel{10, 200, 30, 9});
  const TBitmap32 before = b;
  const TBitmap32 r = PencilContrastPass(b, 0);
  EXPECT_EQ(b, before);
  EXPECT_EQ(r, TBitmap32(3, 1, Pixel{255, 255, 255, 255}));
}

TEST(PencilLightingPass, ShiftsGrayAndClamps) {
  TBitmap32 b(3, 1);
  b.At(0, 0) = Pixel{30, 20, 10, 0};  // R 10, G 20, B 30: gray 18
  b.At(1, 0) = Pixel{0, 0, 1, 0};     // gray Round(0.3) = 0
  b.At(2, 0) = Pixel{1, 1, 1, 0};     // gray 1
  EXPECT_EQ(PencilLightingPass(b, 128).At(0, 0), (Pixel{18, 18, 18, 255}));
  EXPECT_EQ(PencilLightingPass(b, 100).At(0, 0), (Pixel{0, 0, 0, 255}));
  EXPECT_EQ(PencilLightingPass(b, 140).At(0, 0), (Pixel{42, 42, 42, 255}));
  const TBitmap32 bright = PencilLightingPass(b, 255);
  EXPECT_EQ(bright.At(1, 0).r, 254);
  EXPECT_EQ(bright.At(2, 0).r, 255);
  const TBitmap32 dark = PencilLightingPass(b, 0);
  for (int x = 0; x < 3; ++x) EXPECT_EQ(dark.At(x, 0), (Pixel{0, 0, 0, 255}));
}

TEST(TonePasses, EmptyAndSingleRowPictures) {
  EXPECT_TRUE(PencilContrastPass(TBitmap32(), 45).Empty());
  EXPECT_TRUE(PencilLightingPass(TBitmap32(), 45).Empty());
  // A single row is an ordinary picture here.
  EXPECT_EQ(PencilContrastPass(TBitmap32(4, 1, Pixel{0, 0, 0, 0}), 45),
            TBitmap32(4, 1, Pixel{0, 0, 0, 255}));
}

}  // namespace
}  // namespace quillane
