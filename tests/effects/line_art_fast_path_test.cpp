// The row-by-row pen sketch, Vuzorar and pen and ink against their plain steps, on sizes that
// break vector loops and bands, with and without the AVX2 variants.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/mono_reference.h"

namespace quillane {
namespace {

// Blotches of a few flat colours with a little grain: edge maps with strokes, flat paper and
// mid-range values, and photographs with dark areas to outline.
Bitmap32 Blotches(int w, int h, unsigned seed) {
  std::mt19937 rng(seed);
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const int patch = (x / 5 + y / 4 + static_cast<int>(seed)) % 3;
      const auto v = [&](int base) {
        return static_cast<std::uint8_t>(ClampByte(base * patch + static_cast<int>(rng() % 5)));
      };
      b.At(x, y) = Pixel{v(60), v(90), v(110), static_cast<std::uint8_t>(rng())};
    }
  return b;
}

// Thresholds at a gray value the picture has, so that the "equal is ink" rule is met.
int EdgeGrayAtCentre(const Bitmap32& in) {
  Bitmap32 edges = in;
  InvertedSobelEdges(edges);
  const Pixel p = edges.At(in.Width() / 2, in.Height() / 2);
  return GrayValue(p.r, p.g, p.b);
}

TEST(LineArtFastPath, EqualsThePlainStepsAtAwkwardSizes) {
  ForEachSplit([] {
    unsigned seed = 0;
    for (const auto& [w, h] : kAwkwardSizes)
      for (const Bitmap32& in : {Blotches(w, h, ++seed), RandomPicture(w, h, ++seed, true)}) {
        SCOPED_TRACE(::testing::Message() << w << "x" << h << " seed " << seed);
        const int pressure = EdgeGrayAtCentre(in);
        ASSERT_EQ(PenSketch(in, pressure), PenSketchReference(in, pressure));
        for (int d = 1; d <= 4; ++d) {
          const int scope = 1 + static_cast<int>(seed + 3 * static_cast<unsigned>(d)) % 10;
          const auto direction = static_cast<HatchDirection>(d);
          ASSERT_EQ(Vuzorar(in, pressure, scope, direction),
                    VuzorarReference(in, pressure, scope, direction))
              << "direction " << d << " scope " << scope;
        }
        const Pixel centre = in.At(w / 2, h / 2);
        const int threshold = InkGrayValue(centre.r, centre.g, centre.b);
        for (bool colour : {false, true})
          ASSERT_EQ(PenAndInk(in, threshold, colour), PenAndInkReference(in, threshold, colour))
              << "colour " << colour;
      }
  });
  const Bitmap32 none;
  EXPECT_EQ(PenSketch(none, 9), PenSketchReference(none, 9));
  EXPECT_EQ(Vuzorar(none, 9, 3, HatchDirection(2)),
            VuzorarReference(none, 9, 3, HatchDirection(2)));
  EXPECT_EQ(PenAndInk(none, 9, true), PenAndInkReference(none, 9, true));
}

// The integer threshold can only differ from the extended gray next to an exact half, where
// the extended sum's own error might tip it: every such colour, the halves included, in one
// row long enough for the vector loop, at every threshold.
TEST(LineArtFastPath, InkThresholdIsTheExtendedGrayNextToEveryHalf) {
  std::vector<Pixel> row;
  for (int r = 0; r < 256; ++r)
    for (int g = 0; g < 256; ++g)
      for (int b = 0; b < 256; ++b) {
        const int rest = (299 * r + 587 * g + 110 * b) % 1000;
        if (rest >= 499 && rest <= 501)
          row.push_back(Pixel{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
                              static_cast<std::uint8_t>(r), static_cast<std::uint8_t>(r ^ b)});
      }
  std::vector<std::uint8_t> gray(row.size()), cells(row.size());
  for (std::size_t i = 0; i < row.size(); ++i) gray[i] = InkGrayValue(row[i].r, row[i].g, row[i].b);
  ForEachVectorWidth([&] {
    for (int t = 0; t < 256; ++t) {
      InkThresholdCells(row.data(), static_cast<int>(row.size()), t, cells.data());
      for (std::size_t i = 0; i < row.size(); ++i)
        ASSERT_EQ(cells[i], gray[i] > t ? 0xFF : 0) << "threshold " << t << " pixel " << i;
    }
  });
}

}  // namespace
}  // namespace quillane
