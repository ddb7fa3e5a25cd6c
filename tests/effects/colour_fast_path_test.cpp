// Colour filter, colour panel and stria against their plain forms, on sizes that break vector
// loops, the half- and third-size copies and the bands.
#include <gtest/gtest.h>

#include <random>

#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/surface/stria.h"
#include "imaging/parallel.h"
#include "imaging/vector_dispatch.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

class Variant {
 public:
  Variant(RowSplit split, bool avx2) {
    SetRowSplit(split);
    SetAvx2Allowed(avx2);
  }
  ~Variant() {
    SetRowSplit({});
    SetAvx2Allowed(true);
  }
};

// Random colours; alpha 0 or 255 in most pixels, so that stria meets every case.
TBitmap32 Picture(int w, int h, unsigned seed) {
  TBitmap32 b = RandomPicture(w, h, seed);
  std::mt19937 rng(seed);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const unsigned pick = rng() % 4;
      if (pick < 2) b.At(x, y).a = pick == 0 ? 0 : 255;
    }
  return b;
}

constexpr std::pair<int, int> kSizes[] = {{1, 1},   {1, 9},  {9, 1},   {2, 2},  {3, 3},
                                          {4, 5},   {5, 4},  {6, 7},   {17, 9}, {18, 3},
                                          {33, 31}, {40, 6}, {71, 12}, {3, 70}, {100, 100}};
constexpr std::pair<RowSplit, bool> kVariants[] = {
    {RowSplit{1, kParallelThreshold}, true}, {RowSplit{7, 0}, true}, {RowSplit{4, 0}, false}};

TEST(ColourFastPath, FilterEqualsThePlainOne) {
  for (const auto& [split, avx2] : kVariants) {
    const Variant variant(split, avx2);
    unsigned seed = 0;
    for (const auto& [w, h] : kSizes) {
      const TBitmap32 in = Picture(w, h, ++seed);
      for (int k = 1; k <= 6; ++k)
        ASSERT_EQ(filter(in, ColorFilterKind(k)), FilterReference(in, ColorFilterKind(k)))
            << w << "x" << h << " kind " << k << " avx2 " << avx2;
    }
  }
}

TEST(ColourFastPath, PanelEqualsThePlainOneInEveryLayout) {
  for (const auto& [split, avx2] : kVariants) {
    const Variant variant(split, avx2);
    unsigned seed = 100;
    for (const auto& [w, h] : kSizes) {
      const TBitmap32 in = Picture(w, h, ++seed);
      for (int layout = 1; layout <= 6; ++layout)
        ASSERT_EQ(ColorPanel(in, PanelLayout(layout)), ColorPanelReference(in, PanelLayout(layout)))
            << w << "x" << h << " layout " << layout << " avx2 " << avx2;
    }
  }
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
  for (const auto& [split, avx2] : kVariants) {
    const Variant variant(split, avx2);
    unsigned seed = 200;
    for (const auto& [w, h] : kSizes) {
      const TBitmap32 in = Picture(w, h, ++seed);
      for (const Case& c : cases)
        ASSERT_EQ(stria(in, w - c.layerShrink, h - c.layerShrink, c.direction, c.thickness, c.space,
                        c.transparency, c.colour),
                  StriaReference(in, w - c.layerShrink, h - c.layerShrink, c.direction, c.thickness,
                                 c.space, c.transparency, c.colour))
            << w << "x" << h << " thickness " << c.thickness << " avx2 " << avx2;
    }
  }
}

}  // namespace
}  // namespace quillane
