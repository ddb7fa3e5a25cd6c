// The edge map's gray values and cells, in every vector variant, where the gray value's weighted
// sum is an exact half: there only the table decides, in vector groups and in the rest alike.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/vector_dispatch.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

// Mid-level noise: its edge bytes spread over the middle of the range, where exact halves are
// common, unlike the 0 and 255 that strong noise gives.
Bitmap32 QuietNoise(int w, int h) {
  std::mt19937 rng(7);
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto c = [&] { return static_cast<std::uint8_t>(118 + rng() % 21); };
      b.At(x, y) = Pixel{c(), c(), c(), 255};
    }
  return b;
}

TEST(GrayEdgeHalves, RowsAndCellsSettleEveryHalfAsGrayValue) {
  const int w = 301, h = 9;  // groups of 64 and 32 and a rest in every row
  const Bitmap32 source = QuietNoise(w, h);
  const Bitmap32 edges = InvertedSobelEdgesReference(source);
  int up = 0, down = 0;
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const Pixel p = edges.At(x, y);
      const int sum = 30 * p.r + 59 * p.g + 11 * p.b;
      if (sum % 100 == 50) (GrayValue(p.r, p.g, p.b) > sum / 100 ? up : down)++;
    }
  // Both ways of settling a half occur, or the comparison below would prove little.
  ASSERT_GT(up, 5);
  ASSERT_GT(down, 5);

  std::vector<std::uint8_t> gray(w), cells(w);
  for (const VectorWidth widest : {VectorWidth::Avx512, VectorWidth::Avx2, VectorWidth::Plain}) {
    SetWidestVectors(widest);
    for (int y = 0; y < h; ++y) {
      GrayEdgeRow(source, y, gray.data());
      for (int level = -1; level <= 255; ++level) {
        GrayEdgeCells(source, y, level, cells.data());
        for (int x = 0; x < w; ++x) {
          const Pixel p = edges.At(x, y);
          const int v = GrayValue(p.r, p.g, p.b);
          ASSERT_EQ(gray[x], v) << x << ", " << y << " width " << static_cast<int>(widest);
          ASSERT_EQ(cells[x], v > level ? 0xFF : 0) << x << ", " << y << " level " << level;
        }
      }
    }
  }
  SetWidestVectors(VectorWidth::Avx512);
}

}  // namespace
}  // namespace quillane
