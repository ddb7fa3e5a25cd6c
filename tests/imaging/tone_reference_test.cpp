// The colour model, the gray value and the tone passes take fast paths (integer arithmetic,
// tables, threads). These tests compare them with the plain references on every
// input that exists, or large random pictures where the input is a whole picture.
#include <gtest/gtest.h>

#include "imaging/numeric.h"
#include "imaging/tone.h"
#include "tests/imaging/random_picture.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

// The extended-precision gray value the exhaustive check below compares with, pinned.
TEST(ConvertToGray, WeightsAndAlpha) {
  Bitmap32 b(2, 1);
  b.At(0, 0) = Pixel{30, 20, 10, 0};  // R 10, G 20, B 30: Round(18.1)
  b.At(1, 0) = Pixel{0, 0, 5, 1};     // Round(1.5) = 2
  ConvertToGray(b);
  EXPECT_EQ(b.At(0, 0), (Pixel{18, 18, 18, 255}));
  EXPECT_EQ(b.At(1, 0), (Pixel{2, 2, 2, 255}));
  Bitmap32 empty;
  ConvertToGray(empty);
  EXPECT_TRUE(empty.Empty());
}

// One 256 by 256 picture per red level covers every colour there is. The exhaustive checks
// are split by red level into shards, so that they can run side by side.
Bitmap32 AllGreenBlue(int red) {
  Bitmap32 b(256, 256);
  for (int g = 0; g < 256; ++g)
    for (int bl = 0; bl < 256; ++bl)
      b.At(bl, g) = Pixel{static_cast<std::uint8_t>(bl), static_cast<std::uint8_t>(g),
                          static_cast<std::uint8_t>(red), 3};
  return b;
}

class EveryColour : public ::testing::TestWithParam<int> {
 protected:
  static constexpr int kReds = 32;
  int FirstRed() const { return GetParam(); }
  int EndRed() const { return GetParam() + kReds; }
};
INSTANTIATE_TEST_SUITE_P(RedLevels, EveryColour, ::testing::Range(0, 256, 32));

TEST_P(EveryColour, GrayAndLightingMatchTheExtendedPrecisionGrayValue) {
  for (int r = FirstRed(); r < EndRed(); ++r) {
    const Bitmap32 in = AllGreenBlue(r);
    Bitmap32 gray = in;
    ConvertToGray(gray);
    const Bitmap32 dark = PencilLightingPass(in, 100);
    const Bitmap32 light = PencilLightingPass(in, 129);
    for (int g = 0; g < 256; ++g)
      for (int bl = 0; bl < 256; ++bl) {
        const int v = GrayValue(r, g, bl);
        const auto level = [](int y) {
          return Pixel{static_cast<std::uint8_t>(y), static_cast<std::uint8_t>(y),
                       static_cast<std::uint8_t>(y), 255};
        };
        ASSERT_EQ(gray.At(bl, g), level(v)) << r << "," << g << "," << bl;
        ASSERT_EQ(dark.At(bl, g), level(ClampByte(v - 56))) << r << "," << g << "," << bl;
        ASSERT_EQ(light.At(bl, g), level(ClampByte(v + 2))) << r << "," << g << "," << bl;
      }
  }
}

TEST_P(EveryColour, RgbToHslMatchesThePlainConversion) {
  for (int r = FirstRed(); r < EndRed(); ++r)
    for (int g = 0; g < 256; ++g)
      for (int b = 0; b < 256; ++b)
        ASSERT_EQ(RgbToHsl(r, g, b), RgbToHslReference(r, g, b)) << r << "," << g << "," << b;
}

TEST(PencilLightingPass, AllPositionsAtTheExtremes) {
  Bitmap32 in(256, 3);
  for (int x = 0; x < 256; ++x) {
    const auto v = static_cast<std::uint8_t>(x);
    in.At(x, 0) = Pixel{v, v, v, 0};
    in.At(x, 1) = Pixel{0, 0, v, 0};
    in.At(x, 2) = Pixel{v, static_cast<std::uint8_t>(255 - x), 0, 0};
  }
  for (int v = 0; v < 256; ++v) {
    const Bitmap32 out = PencilLightingPass(in, v);
    for (int y = 0; y < 3; ++y)
      for (int x = 0; x < 256; ++x) {
        const Pixel p = in.At(x, y);
        const auto e =
            static_cast<std::uint8_t>(ClampByte(GrayValue(p.r, p.g, p.b) + 2 * (v - 128)));
        ASSERT_EQ(out.At(x, y), (Pixel{e, e, e, 255})) << x << "," << y << " v=" << v;
      }
  }
  EXPECT_TRUE(PencilLightingPass(Bitmap32(), 45).Empty());
}

class EveryHsl : public ::testing::TestWithParam<int> {};
INSTANTIATE_TEST_SUITE_P(HueRanges, EveryHsl, ::testing::Values(-2, 90, 180, 270));

TEST_P(EveryHsl, HslToRgbMatchesThePlainConversion) {
  const int first = GetParam(), end = first == 270 ? 362 : first + (first < 0 ? 92 : 90);
  for (int h = first; h < end; ++h)
    for (int s = -2; s <= 102; ++s)
      for (int l = -2; l <= 102; ++l)
        ASSERT_EQ(HslToRgb(h, s, l), HslToRgbReference(h, s, l)) << h << "," << s << "," << l;
}

TEST(PencilContrastPass, MatchesThePlainChainOnColourAndGrayPictures) {
  unsigned seed = 0;
  for (auto [w, h] : {std::pair{1, 1}, {7, 3}, {320, 240}})
    for (bool grayish : {false, true}) {
      const Bitmap32 in = RandomPicture(w, h, ++seed, grayish);
      for (int c : {0, 10, 44, 45, 46, 60, 89})
        ASSERT_EQ(PencilContrastPass(in, c), PencilContrastPassReference(in, c))
            << w << "x" << h << " c=" << c;
    }
}

}  // namespace
}  // namespace quillane
