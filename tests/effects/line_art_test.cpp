// Pen sketch, Vuzorar and Pen and ink: their documented cases, and the fast routines against
// the plain steps at every awkward size.
#include <gtest/gtest.h>

#include <random>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"

namespace quillane {
namespace {

// Few levels per channel, so that thresholds and edges fall on every kind of pixel.
TBitmap32 RandomPicture(int w, int h, unsigned seed, int levels) {
  std::mt19937 rng(seed);
  TBitmap32 b(w, h);
  const auto v = [&] { return static_cast<std::uint8_t>(rng() % levels * (255 / (levels - 1))); };
  for (Pixel* p = b.Data(); p != b.Data() + b.PixelCount(); ++p) *p = Pixel{v(), v(), v(), v()};
  return b;
}

// Empty, single lines, no interior, one interior pixel, and large enough for several threads.
const std::pair<int, int> kSizes[] = {{0, 0}, {1, 1}, {1, 7}, {7, 1},   {2, 5},    {5, 2},
                                      {3, 3}, {3, 9}, {9, 3}, {37, 23}, {640, 480}};

TEST(LineArt, FastRoutinesMatchThePlainSteps) {
  unsigned seed = 0;
  for (auto [w, h] : kSizes) {
    SCOPED_TRACE(std::to_string(w) + "x" + std::to_string(h));
    ++seed;
    const TBitmap32 in = RandomPicture(w, h, seed, 2 + static_cast<int>(seed % 5));
    const int level = static_cast<int>(seed * 37 % 256);
    EXPECT_EQ(PenSketch(in, level), PenSketchReference(in, level));
    for (int d = 1; d <= 4; ++d) {
      const int scope = w > 100 ? 2 : 1 + (static_cast<int>(seed) + 3 * d) % 10;
      const auto direction = static_cast<HatchDirection>(d);
      EXPECT_EQ(Vuzorar(in, level, scope, direction), VuzorarReference(in, level, scope, direction))
          << d;
    }
    for (bool colour : {false, true})
      EXPECT_EQ(Pen_and_Ink(in, level, colour), PenAndInkReference(in, level, colour)) << colour;
  }
}

TEST(PenSketch, AGrayValueEqualToThePressureIsInk) {
  TBitmap32 levels(3, 1);
  for (std::uint8_t v : {99, 100, 101}) levels.At(v - 99, 0) = Pixel{v, v, v, 7};
  two_Value1Click(levels, 100);
  EXPECT_EQ(levels.ScanLine(0)[1], kInk);
  EXPECT_EQ(levels.ScanLine(0)[2], kPaper);
  const TBitmap32 flat(6, 5, Pixel{40, 90, 200, 255});
  EXPECT_EQ(PenSketch(flat, 254), TBitmap32(6, 5, kPaper));
  EXPECT_EQ(PenSketch(flat, 255), TBitmap32(6, 5, kInk));
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
    TBitmap32 b(11, 11, kPaper);
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
  TBitmap32 disc(17, 17, kPaper), line(9, 8, kPaper);
  for (int y = 0; y < 17; ++y)
    for (int x = 0; x < 17; ++x)
      if ((x - 8) * (x - 8) + (y - 8) * (y - 8) <= 36) disc.At(x, y) = kInk;
  for (int y = 0; y < 8; ++y) line.At(4, y) = line.At(5, y) = kInk;
  const TBitmap32 rim = Pen_and_Ink(disc, 128, false);
  EXPECT_EQ(rim.At(2, 8), kInk);
  EXPECT_EQ(rim.At(4, 8), kPaper);
  EXPECT_EQ(Pen_and_Ink(line, 128, false), line);
  // Everything inked at 254: a frame, in the source's colours with colour ink.
  const TBitmap32 in = RandomPicture(7, 5, 5, 256);
  const TBitmap32 frame = Pen_and_Ink(in, 254, true);
  for (int y = 0; y < 5; ++y)
    for (int x = 0; x < 7; ++x) {
      const Pixel s = in.At(x, y), ink{s.b, s.g, s.r, 255};
      EXPECT_EQ(frame.At(x, y), x % 6 && y % 4 ? kPaper : ink);
    }
}

}  // namespace
}  // namespace quillane
