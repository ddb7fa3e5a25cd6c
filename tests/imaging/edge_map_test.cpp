#include "imaging/edge_map.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tests/imaging/random_picture.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

Pixel Rgb(std::uint8_t r, std::uint8_t g, std::uint8_t b, std::uint8_t a = 255) {
  return Pixel{b, g, r, a};
}
Pixel Inverted(Pixel p) {
  return Pixel{static_cast<std::uint8_t>(255 - p.b), static_cast<std::uint8_t>(255 - p.g),
               static_cast<std::uint8_t>(255 - p.r), p.a};
}

Bitmap32 Sobel(Bitmap32 b) {
  InvertedSobelEdges(b);
  return b;
}

// Colour channels only: the alpha of the edge map is not part of its result.
Bitmap32 Opaque(Bitmap32 b) {
  SetAlphaChannel(b, 255);
  return b;
}
::testing::AssertionResult SameColours(const Bitmap32& actual, const Bitmap32& expected) {
  if (Opaque(actual) == Opaque(expected)) return ::testing::AssertionSuccess();
  return ::testing::AssertionFailure() << "colours differ";
}

// Two wide: inner rows take their own pixel 1, and the top and bottom rows repeat rows 1 and
// H - 2. Two high: both rows are row 1.
TEST(Picsobel, TwoHighOrTwoWideRepeatsTheSecondLineInverted) {
  for (auto [w, h] : {std::pair{6, 2}, {2, 5}, {2, 2}}) {
    const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * h));
    Bitmap32 expected(w, h);
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x)
        expected.At(x, y) =
            h == 2 ? Inverted(in.At(x, 1)) : Inverted(in.At(1, std::clamp(y, 1, h - 2)));
    EXPECT_TRUE(SameColours(Sobel(in), expected)) << w << "x" << h;
  }
}

TEST(Picsobel, ThreeByThreeBordersRepeatTheOneInteriorPixel) {
  Bitmap32 in(3, 3, Rgb(10, 20, 30));
  in.At(1, 1) = Rgb(50, 20, 0);
  in.At(0, 1) = Rgb(40, 30, 30);
  // Red: line kernel 6 * 50 - 6 * 10 = 240, gradient 40 - 10 = 30: 255 - 240 = 15.
  // Green: 120 - 120 = 0 and 30 - 20 = 10: 245. Blue: 0 - 180 < 0 and 30 - 30 = 0: 255.
  EXPECT_TRUE(SameColours(Sobel(in), Bitmap32(3, 3, Rgb(15, 245, 255))));
}

// Too small for a neighbour on one side: what there is repeats, inverted. A single column
// still has its top and bottom rows repeat rows 1 and H - 2; a single row has no rows to take.
TEST(Picsobel, SingleLinesRepeatWhatThereIsAndEmptyStaysEmpty) {
  for (auto [w, h] : {std::pair{1, 1}, {1, 2}, {1, 3}, {1, 6}, {5, 1}, {2, 1}}) {
    const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * 10 + h));
    Bitmap32 expected = in;
    if (h >= 2) {
      expected.At(0, 0) = in.At(0, 1);
      expected.At(0, h - 1) = expected.At(0, h - 2);
    }
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x) expected.At(x, y) = Inverted(expected.At(x, y));
    EXPECT_TRUE(SameColours(Sobel(in), expected)) << w << "x" << h;
  }
  EXPECT_TRUE(Sobel(Bitmap32()).Empty());
}

// The library works row by row, in bands on several threads and on all channels at once; the
// reference goes pixel by pixel and channel by channel. Every byte must agree, alpha included.
TEST(Picsobel, MatchesTheStepByStepReference) {
  unsigned seed = 10;
  for (auto [w, h] :
       {std::pair{3, 3}, {4, 3}, {3, 4}, {17, 5}, {31, 29}, {101, 57}, {257, 130}, {733, 511}}) {
    const Bitmap32 in = RandomPicture(w, h, ++seed);
    EXPECT_EQ(Sobel(in), InvertedSobelEdgesReference(in)) << w << "x" << h;
  }
}

}  // namespace
}  // namespace quillane
