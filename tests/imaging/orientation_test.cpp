// Standing pictures upright by a camera's orientation: every pixel lands where the tag's
// description puts it, at every size and however the rows are split between threads.
#include "imaging/orientation.h"

#include <gtest/gtest.h>

#include "imaging/parallel.h"
#include "tests/imaging/fast_path_support.h"

namespace quillane {
namespace {

// Where the stored pixel at (u, v) of a W by H stored picture shows, from the tag's own words:
// which side of the scene its row 0 and column 0 show.
std::pair<int, int> ShownAt(int orientation, int u, int v, int w, int h) {
  switch (orientation) {
    case 2:
      return {w - 1 - u, v};  // row 0 top, column 0 right
    case 3:
      return {w - 1 - u, h - 1 - v};  // row 0 bottom, column 0 right
    case 4:
      return {u, h - 1 - v};  // row 0 bottom, column 0 left
    case 5:
      return {v, u};  // row 0 left, column 0 top
    case 6:
      return {h - 1 - v, u};  // row 0 right, column 0 top
    case 7:
      return {h - 1 - v, w - 1 - u};  // row 0 right, column 0 bottom
    case 8:
      return {v, w - 1 - u};  // row 0 left, column 0 bottom
    default:
      return {u, v};
  }
}

TEST(UprightPicture, PutsEveryStoredPixelWhereTheTagSays) {
  for (const RowSplit split : {RowSplit{}, RowSplit{4, 0}}) {
    SetRowSplit(split);
    for (const auto& [w, h] : kAwkwardSizes) {
      const Bitmap32 stored = RandomPicture(w, h, static_cast<unsigned>(w * 1000 + h));
      for (int orientation = 0; orientation <= 9; ++orientation) {
        const Bitmap32 upright = UprightPicture(stored, orientation);
        const bool swaps = OrientationSwapsSides(orientation);
        ASSERT_EQ(upright.Width(), swaps ? h : w) << orientation;
        ASSERT_EQ(upright.Height(), swaps ? w : h) << orientation;
        for (int v = 0; v < h; ++v)
          for (int u = 0; u < w; ++u) {
            const auto [x, y] = ShownAt(orientation, u, v, w, h);
            ASSERT_EQ(upright.At(x, y), stored.At(u, v))
                << w << "x" << h << " orientation " << orientation << " at " << u << "," << v;
          }
      }
    }
  }
  SetRowSplit({});
  EXPECT_TRUE(UprightPicture(Bitmap32(), 6).Empty());
}

}  // namespace
}  // namespace quillane
