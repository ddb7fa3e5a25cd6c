// Pen sketch, Vuzorar and Pen and ink: their documented cases. The fast routines are compared
// with the plain steps in the fast-path tests.
#include <gtest/gtest.h>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "tests/imaging/random_picture.h"
#include "tests/reference/mono_reference.h"

namespace quillane {
namespace {

TEST(PenSketch, AGrayValueEqualToThePressureIsInk) {
  Bitmap32 levels(3, 1);
  for (std::uint8_t v : {99, 100, 101}) levels.At(v - 99, 0) = Pixel{v, v, v, 7};
  ThresholdToInk(levels, 100);
  EXPECT_EQ(levels.ScanLine(0)[1], kInk);
  EXPECT_EQ(levels.ScanLine(0)[2], kPaper);
  const Bitmap32 flat(6, 5, Pixel{40, 90, 200, 255});
  EXPECT_EQ(PenSketch(flat, 254), Bitmap32(6, 5, kPaper));
  EXPECT_EQ(PenSketch(flat, 255), Bitmap32(6, 5, kInk));
}

TEST(Vuzorar, ADotBecomesAStrokeOfTwoSPlusOne) {
  using Points = std::vector<std::pair<int, int>>;  // ink in row order
  const std::tuple<HatchDirection, int, Points> cases[] = {
      {HatchDirection::Horizontal, 1, {{4, 5}, {5, 5}, {6, 5}}},
      {HatchDirection::Rising, 3, {{8, 2}, {7, 3}, {6, 4}, {5, 5}, {4, 6}, {3, 7}, {2, 8}}},
      {HatchDirection::Falling, 1, {{4, 4}, {5, 5}, {6, 6}}},
      // Up to the border rows, which are read but never written.
      {HatchDirection::Vertical,
       9,
       {{5, 1}, {5, 2}, {5, 3}, {5, 4}, {5, 5}, {5, 6}, {5, 7}, {5, 8}, {5, 9}}},
  };
  for (const auto& [direction, passes, expected] : cases) {
    Bitmap32 b(11, 11, kPaper);
    b.At(5, 5) = kInk;
    for (int i = 0; i < passes; ++i) BitmapDilate(b, direction);
    Points ink;
    for (int i = 0; i < 121; ++i)
      if (b.Data()[i] == kInk) ink.emplace_back(i % 11, i / 11);
    EXPECT_EQ(ink, expected) << static_cast<int>(direction) << " x" << passes;
  }
}

TEST(PenAndInk, ItsOwnGrayWeightsReachNoFurtherThan254) {
  EXPECT_EQ(InkGrayValue(255, 255, 255), 254);
  EXPECT_EQ(InkGrayValue(128, 128, 128), 127);
  EXPECT_EQ(InkGrayValue(1, 0, 0) + InkGrayValue(0, 0, 1), 0);
  EXPECT_EQ(InkGrayValue(0, 1, 0), 1);
}

TEST(PenAndInk, InkAreasBecomeTheirRim) {
  // A disc of radius 6 keeps its leftmost pixel and loses the one inside it; a line two pixels
  // wide survives whole.
  Bitmap32 disc(17, 17, kPaper), line(9, 8, kPaper);
  for (int y = 0; y < 17; ++y)
    for (int x = 0; x < 17; ++x)
      if ((x - 8) * (x - 8) + (y - 8) * (y - 8) <= 36) disc.At(x, y) = kInk;
  for (int y = 0; y < 8; ++y) line.At(4, y) = line.At(5, y) = kInk;
  const Bitmap32 rim = PenAndInk(disc, 128, false);
  EXPECT_EQ(rim.At(2, 8), kInk);
  EXPECT_EQ(rim.At(4, 8), kPaper);
  EXPECT_EQ(PenAndInk(line, 128, false), line);
  // Everything inked at 254: a frame, in the source's colours with colour ink.
  const Bitmap32 in = RandomPicture(7, 5, 5);
  const Bitmap32 frame = PenAndInk(in, 254, true);
  for (int y = 0; y < 5; ++y)
    for (int x = 0; x < 7; ++x) {
      const Pixel s = in.At(x, y), ink{s.b, s.g, s.r, 255};
      EXPECT_EQ(frame.At(x, y), x % 6 && y % 4 ? kPaper : ink);
    }
}

}  // namespace
}  // namespace quillane
