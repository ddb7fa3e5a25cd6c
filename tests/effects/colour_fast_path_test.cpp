// Colour filter, colour panel and stria against their plain forms, on sizes that break vector
// loops, the half- and third-size copies and the bands.
#include <gtest/gtest.h>

#include <random>

#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/surface/stria.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/adjust_reference.h"
#include "tests/reference/surface_reference.h"

namespace quillane {
namespace {

// Random colours; alpha 0 or 255 in most pixels, so that stria meets every case.
Bitmap32 Picture(int w, int h, unsigned seed) {
  Bitmap32 b = RandomPicture(w, h, seed);
  std::mt19937 rng(seed);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const unsigned pick = rng() % 4;
      if (pick < 2) b.At(x, y).a = pick == 0 ? 0 : 255;
    }
  return b;
}

// Six filter kinds and six panel layouts, each against its plain form.
TEST(ColourFastPath, FilterAndPanelEqualThePlainOnes) {
  ForEachSplit([&] {
    unsigned seed = 0;
    for (const auto& [w, h] : kAwkwardSizes) {
      const Bitmap32 in = Picture(w, h, ++seed);
      for (int k = 1; k <= 6; ++k) {
        SCOPED_TRACE(::testing::Message() << w << "x" << h << " kind or layout " << k);
        ASSERT_EQ(ColorFilter(in, ColorFilterKind(k)), FilterReference(in, ColorFilterKind(k)));
        ASSERT_EQ(ColorPanel(in, PanelLayout(k)), ColorPanelReference(in, PanelLayout(k)));
      }
    }
  });
}

TEST(ColourFastPath, StriaEqualsThePlainOne) {
  struct Case {
    StriaDirection direction;
    int thickness, space, transparency;
    std::uint32_t colour;
    int layerShrink;  // the layer this much smaller than the picture each way
  };
  const Case cases[] = {{StriaDirection::Vertical, 1, 2, 128, 0x000000, 0},
                        {StriaDirection::Vertical, 3, 5, 0, 0x3080FF, 2},
                        {StriaDirection::Horizontal, 2, 1, 200, 0xFFFFFF, 0},
                        {StriaDirection::Horizontal, 1, 1, 255, 0x123456, 1},
                        {StriaDirection::Vertical, 100, 255, 77, 0x00FF00, -3}};
  ForEachSplit([&] {
    unsigned seed = 200;
    for (const auto& [w, h] : kAwkwardSizes) {
      const Bitmap32 in = Picture(w, h, ++seed);
      for (const Case& c : cases)
        ASSERT_EQ(stria(in, w - c.layerShrink, h - c.layerShrink, c.direction, c.thickness, c.space,
                        c.transparency, c.colour),
                  StriaReference(in, w - c.layerShrink, h - c.layerShrink, c.direction, c.thickness,
                                 c.space, c.transparency, c.colour))
            << w << "x" << h << " thickness " << c.thickness;
    }
  });
}

}  // namespace
}  // namespace quillane
