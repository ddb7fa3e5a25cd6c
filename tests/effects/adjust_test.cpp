// HSL adjust, colour filter, colour variety and colour panel on small crafted pictures, and
// against their plain formulas.
#include <gtest/gtest.h>

#include <algorithm>

#include "effects/adjust/hsl_adjust.h"
#include "imaging/tone.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

Pixel Rgb3(int r, int g, int b) {
  return Pixel{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
               static_cast<std::uint8_t>(r), 255};
}

TEST(HslAdjust, ExamplesOfEachSlider) {
  struct Case {
    int hue, saturation, lighting;
    Pixel in, out;
  } const cases[] = {
      {180, 100, 100, Rgb3(255, 0, 0), Rgb3(255, 0, 0)},
      {180, 100, 100, Rgb3(128, 128, 128), Rgb3(128, 128, 128)},
      {180, 100, 100, Rgb3(200, 200, 200), Rgb3(199, 199, 199)},
      {180, 100, 100, Rgb3(200, 100, 100), Rgb3(201, 101, 101)},
      {0, 100, 100, Rgb3(255, 0, 0), Rgb3(0, 255, 255)},
      {360, 100, 100, Rgb3(255, 0, 0), Rgb3(0, 255, 255)},
      {300, 100, 100, Rgb3(255, 0, 255), Rgb3(255, 255, 0)},  // 300 + 120 wraps to 60
      {180, 0, 100, Rgb3(255, 0, 0), Rgb3(128, 128, 128)},
      {180, 0, 100, Rgb3(200, 200, 200), Rgb3(199, 199, 199)},
      {180, 0, 100, Rgb3(10, 20, 30), Rgb3(20, 20, 20)},
      {90, 130, 200, Rgb3(10, 20, 30), Rgb3(255, 255, 255)},
      {45, 200, 0, Rgb3(250, 240, 230), Rgb3(0, 0, 0)},
  };
  for (const Case& c : cases) {
    Pixel in = c.in;
    in.a = 9;
    EXPECT_EQ(HslAdjust(TBitmap32(1, 1, in), c.hue, c.saturation, c.lighting).At(0, 0), c.out)
        << c.hue << " " << c.saturation << " " << c.lighting;
  }
}

TEST(HslAdjust, MatchesTheConversionsPixelByPixel) {
  for (auto [w, h] : {std::pair{37, 29}, {1, 5}, {2, 1}, {0, 0}})
    for (int hue : {0, 77, 180, 359, 360})
      for (auto [s, l] : {std::pair{100, 100}, {37, 160}, {200, 3}}) {
        const TBitmap32 in = RandomPicture(w, h, static_cast<unsigned>(hue + s + l));
        TBitmap32 expected = in;
        for (int y = 0; y < h; ++y)
          for (int x = 0; x < w; ++x) {
            const Pixel p = in.At(x, y);
            const Hsl c = RgbToHsl(p.r, p.g, p.b);
            const Rgb o = HslToRgb((c.h + hue + 180) % 360, std::clamp(c.s + s - 100, 0, 100),
                                   std::clamp(c.l + l - 100, 0, 100));
            expected.At(x, y) = Rgb3(o.r, o.g, o.b);
          }
        ASSERT_EQ(HslAdjust(in, hue, s, l), expected) << w << "x" << h << " " << hue;
      }
}

}  // namespace
}  // namespace quillane
