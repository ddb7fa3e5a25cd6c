#include "effects/paint/color_pencil.h"

#include <gtest/gtest.h>

#include "tests/imaging/random_picture.h"
#include "tests/reference/paint_reference.h"

namespace quillane {
namespace {

const Pixel kWhite{255, 255, 255, 255};

// Three pixels in four gray, the rest any colour: flat areas, grays and edges everywhere.
Bitmap32 Varied(int w, int h) {
  return RandomPicture(w, h, 3, true);
}

TEST(ColorPencil, FlatAreasTurnWhiteAndStrongEdgesKeepTheirColour) {
  EXPECT_EQ(ColorPencil(Bitmap32(6, 5, Pixel{30, 140, 220, 255}), 45), Bitmap32(6, 5, kWhite));
  // A one-pixel line of (R, G, B) = (200, 100, 100) on black: its edge map is black there, so
  // it keeps its lightness and comes back through the HSL model as (201, 101, 101).
  Bitmap32 line(7, 5, Pixel{0, 0, 0, 255});
  for (int x = 0; x < 7; ++x) line.At(x, 2) = Pixel{100, 100, 200, 255};
  const Bitmap32 out = ColorPencil(line, 45);
  EXPECT_EQ(out.At(3, 2), (Pixel{101, 101, 201, 255}));
  EXPECT_EQ(out.At(3, 0), kWhite);
  EXPECT_EQ(out.At(3, 1), kWhite);
  EXPECT_EQ(ColorPencil(line, 0), Bitmap32(7, 5, kWhite));
}

TEST(ColorPencil, TablesGiveTheStepByStepBytesAtEveryPressure) {
  const Bitmap32 source = Varied(40, 23);
  for (int p = 0; p <= 89; ++p)
    ASSERT_EQ(ColorPencil(source, p), ColorSketchReference(source, p)) << p;
  for (auto [w, h] : {std::pair{0, 0}, {1, 1}, {1, 6}, {6, 1}, {2, 5}, {5, 2}, {3, 3}})
    EXPECT_EQ(ColorPencil(Varied(w, h), 70), ColorSketchReference(Varied(w, h), 70));
}

}  // namespace
}  // namespace quillane
