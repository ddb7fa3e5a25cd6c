#include "effects/paint/water_color.h"

#include <gtest/gtest.h>

#include "tests/imaging/random_picture.h"
#include "tests/reference/paint_reference.h"

namespace quillane {
namespace {

// The passes' own formulas are checked against the plain ones elsewhere; here the frame the
// whole effect leaves alone, and pictures too small for a 3 x 3 neighbourhood.
TEST(WaterColor, KeepsTheFrameAndTinyPictures) {
  const Bitmap32 in = RandomPicture(40, 9, 11);
  for (int n = 1; n <= 5; ++n) {
    const Bitmap32 out = WaterColor(in, n);
    ASSERT_EQ(out, WaterColorReference(in, n)) << n;
    for (int x = 0; x < 40; ++x) EXPECT_EQ(out.At(x, 8), in.At(x, 8));
    for (int y = 0; y < 9; ++y) EXPECT_EQ(out.At(0, y), in.At(0, y));
  }
  for (auto [w, h] : {std::pair{0, 0}, {1, 6}, {6, 1}, {2, 5}, {5, 2}})
    EXPECT_EQ(WaterColor(RandomPicture(w, h, 3), 3), RandomPicture(w, h, 3));
}

}  // namespace
}  // namespace quillane
