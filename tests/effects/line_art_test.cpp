// Pen sketch, Vuzorar and Pen and ink: their documented cases, and the fast routines against
// the plain step-by-step ones on pictures of every awkward size.
#include <gtest/gtest.h>

#include <random>

#include "effects/mono/pen_and_ink.h"
#include "effects/mono/pen_sketch.h"
#include "effects/mono/vuzorar.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"

namespace quillane {
namespace {

constexpr Pixel kWhite{255, 255, 255, 255};
constexpr Pixel kBlack{0, 0, 0, 255};

TBitmap32 RandomPicture(int w, int h, unsigned seed, int levels = 256) {
  std::mt19937 rng(seed);
  TBitmap32 b(w, h);
  for (Pixel* p = b.Data(); p != b.Data() + b.PixelCount(); ++p) {
    const auto v = [&] { return static_cast<std::uint8_t>(rng() % levels * (255 / (levels - 1))); };
    *p = Pixel{v(), v(), v(), v()};
  }
  return b;
}

// Sizes the fast routines must survive and agree on: empty, single lines, no interior, one
// interior pixel, and large enough for several threads.
const std::pair<int, int> kSizes[] = {{0, 0}, {1, 1}, {1, 7}, {7, 1}, {2, 5},
                                      {5, 2}, {3, 3}, {3, 9}, {9, 3}, {37, 23}};
// And one picture large enough for several threads.
constexpr int kLargeWidth = 640, kLargeHeight = 480;

TBitmap32 PlainPenSketch(TBitmap32 picture, int pressure) {
  picsobel(picture);
  for (Pixel* p = picture.Data(); p != picture.Data() + picture.PixelCount(); ++p)
    *p = GrayValue(p->r, p->g, p->b) > pressure ? kWhite : kBlack;
  return picture;
}

TEST(PenSketch, FlatPicturesAndTheExtremePressures) {
  const TBitmap32 flat(6, 5, Pixel{40, 90, 200, 255});
  for (int p : {0, 128, 254}) EXPECT_EQ(PenSketch(flat, p), TBitmap32(6, 5, kWhite)) << p;
  EXPECT_EQ(PenSketch(RandomPicture(9, 7, 1), 255), TBitmap32(9, 7, kBlack));
}

TEST(PenSketch, AGrayValueEqualToThePressureIsInk) {
  TBitmap32 levels(3, 1);
  levels.At(0, 0) = Pixel{99, 99, 99, 7};
  levels.At(1, 0) = Pixel{100, 100, 100, 7};
  levels.At(2, 0) = Pixel{101, 101, 101, 7};
  two_Value1Click(levels, 100);
  EXPECT_EQ(levels.At(0, 0), kBlack);
  EXPECT_EQ(levels.At(1, 0), kBlack);
  EXPECT_EQ(levels.At(2, 0), kWhite);
}

TEST(PenSketch, MatchesThePlainStepsAtEverySize) {
  unsigned seed = 20;
  for (auto [w, h] : kSizes)
    for (int pressure : {0, 100, 200, 255}) {
      const TBitmap32 in = RandomPicture(w, h, ++seed, 6);
      EXPECT_EQ(PenSketch(in, pressure), PlainPenSketch(in, pressure)) << w << "x" << h;
    }
  const TBitmap32 large = RandomPicture(kLargeWidth, kLargeHeight, 7, 6);
  EXPECT_EQ(PenSketch(large, 150), PlainPenSketch(large, 150));
}

// --- Vuzorar -----------------------------------------------------------------------------------

TBitmap32 DotPicture(int x, int y, int size = 11) {
  TBitmap32 b(size, size, kWhite);
  b.At(x, y) = kBlack;
  return b;
}

std::vector<std::pair<int, int>> InkAt(const TBitmap32& b) {
  std::vector<std::pair<int, int>> ink;
  for (int y = 0; y < b.Height(); ++y)
    for (int x = 0; x < b.Width(); ++x)
      if (b.At(x, y) == kBlack) ink.emplace_back(x, y);
  return ink;
}

TEST(Vuzorar, ADotBecomesAStrokeOfTwoSPlusOne) {
  struct Case {
    HatchDirection d;
    int passes;
    std::vector<std::pair<int, int>> ink;  // in row order
  };
  const Case cases[] = {
      {HatchDirection::Horizontal, 1, {{4, 5}, {5, 5}, {6, 5}}},
      {HatchDirection::Rising, 3, {{8, 2}, {7, 3}, {6, 4}, {5, 5}, {4, 6}, {3, 7}, {2, 8}}},
      {HatchDirection::Falling, 2, {{3, 3}, {4, 4}, {5, 5}, {6, 6}, {7, 7}}},
      {HatchDirection::Vertical, 2, {{5, 3}, {5, 4}, {5, 5}, {5, 6}, {5, 7}}},
      // Stops at the border rows, which are read but never written.
      {HatchDirection::Vertical,
       9,
       {{5, 1}, {5, 2}, {5, 3}, {5, 4}, {5, 5}, {5, 6}, {5, 7}, {5, 8}, {5, 9}}},
  };
  for (const Case& c : cases) {
    TBitmap32 b = DotPicture(5, 5);
    for (int i = 0; i < c.passes; ++i) BitmapDilate(b, c.d);
    EXPECT_EQ(InkAt(b), c.ink) << static_cast<int>(c.d) << " x" << c.passes;
  }
}

TEST(Vuzorar, InkOnTheBorderSpreadsInwardsAndAlphaStays) {
  TBitmap32 b = DotPicture(0, 4, 6);
  b.At(3, 2) = Pixel{0, 0, 9, 77};  // red 9: paper
  BitmapDilate(b, HatchDirection::Horizontal);
  BitmapDilate(b, HatchDirection::Horizontal);
  EXPECT_EQ(InkAt(b), (std::vector<std::pair<int, int>>{{0, 4}, {1, 4}, {2, 4}}));
  b.At(2, 1) = kBlack;
  BitmapDilate(b, HatchDirection::Falling);
  EXPECT_EQ(b.At(3, 2), (Pixel{0, 0, 0, 77}));
}

TEST(Vuzorar, PicturesUnderThreeLinesAreNotDilated) {
  for (auto [w, h] : {std::pair{2, 6}, {6, 2}, {1, 1}}) {
    const TBitmap32 in = RandomPicture(w, h, 3, 2);
    TBitmap32 out = in;
    for (HatchDirection d : {HatchDirection::Rising, HatchDirection::Horizontal})
      BitmapDilate(out, d);
    EXPECT_EQ(out, in) << w << "x" << h;
  }
}

TEST(Vuzorar, MatchesThePlainStepsAtEverySize) {
  unsigned seed = 40;
  for (auto [w, h] : kSizes)
    for (int d = 1; d <= 4; ++d)
      for (auto [pressure, scope] : {std::pair{128, 3}, {60, 1}, {255, 2}, {200, 10}}) {
        const TBitmap32 in = RandomPicture(w, h, ++seed, 4);
        TBitmap32 expected = PlainPenSketch(in, pressure);
        for (int i = 0; i < scope; ++i) BitmapDilate(expected, static_cast<HatchDirection>(d));
        EXPECT_EQ(Vuzorar(in, pressure, scope, static_cast<HatchDirection>(d)), expected)
            << w << "x" << h << " d" << d << " p" << pressure << " s" << scope;
      }
  const TBitmap32 large = RandomPicture(kLargeWidth, kLargeHeight, 8, 4);
  for (int d = 1; d <= 4; ++d) {
    TBitmap32 expected = PlainPenSketch(large, 100);
    for (int i = 0; i < 2; ++i) BitmapDilate(expected, static_cast<HatchDirection>(d));
    EXPECT_EQ(Vuzorar(large, 100, 2, static_cast<HatchDirection>(d)), expected) << d;
  }
}

// --- Pen and ink -------------------------------------------------------------------------------

TBitmap32 PlainPenAndInk(const TBitmap32& source, int threshold, bool colorInk) {
  TBitmap32 t = source;
  PictureTwoValue(t, threshold);
  TBitmap32 outline = penandink(t);
  if (colorInk) ColorValue(outline, source);
  return outline;
}

TEST(PenAndInk, ItsOwnGrayWeights) {
  struct Case {
    Pixel colour;
    int threshold;
    bool ink;
  };
  const Case cases[] = {
      {{1, 0, 0, 255}, 0, true},  // blue 1: 0.11
      {{0, 0, 1, 255}, 0, true},  // red 1: 0.299
      {{0, 1, 0, 255}, 0, false},         {{128, 128, 128, 255}, 128, true},
      {{128, 128, 128, 255}, 126, false}, {{255, 255, 255, 255}, 254, true},
      {{255, 255, 255, 255}, 253, false},
  };
  for (const Case& c : cases)
    EXPECT_EQ(Pen_and_Ink(TBitmap32(1, 1, c.colour), c.threshold, false).At(0, 0),
              c.ink ? kBlack : kWhite)
        << int{c.colour.r} << " at " << c.threshold;
}

// The integer gray can only differ from the extended one next to an exact half, where the
// extended sum's own error might tip it; every such colour is checked, the halves included.
TEST(PenAndInk, FastGrayIsTheExtendedGrayNextToEveryHalf) {
  int checked = 0;
  for (int r = 0; r < 256; ++r)
    for (int g = 0; g < 256; ++g)
      for (int b = 0; b < 256; ++b) {
        const int rest = (299 * r + 587 * g + 110 * b) % 1000;
        if (rest < 499 || rest > 501) continue;
        const Pixel p{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
                      static_cast<std::uint8_t>(r), 255};
        std::uint8_t fast = 0;
        InkGrayLevels(&p, &fast, 1);
        ASSERT_EQ(fast, InkGrayValue(r, g, b)) << r << "," << g << "," << b;
        ++checked;
      }
  EXPECT_GT(checked, 40000);
}

TEST(PenAndInk, InkAreasBecomeTheirRim) {
  // A black disc of radius 6: its rim is a closed curve one pixel thick.
  TBitmap32 disc(17, 17, kWhite), rim(17, 17, kWhite);
  const auto inDisc = [](int x, int y) { return (x - 8) * (x - 8) + (y - 8) * (y - 8) <= 36; };
  for (int y = 0; y < 17; ++y)
    for (int x = 0; x < 17; ++x) {
      if (!inDisc(x, y)) continue;
      disc.At(x, y) = kBlack;
      bool inside = true;
      for (int j = -1; j <= 1; ++j)
        for (int i = -1; i <= 1; ++i) inside = inside && inDisc(x + i, y + j);
      if (!inside) rim.At(x, y) = kBlack;
    }
  EXPECT_EQ(Pen_and_Ink(disc, 128, false), rim);
  EXPECT_EQ(rim.At(2, 8), kBlack);
  EXPECT_EQ(rim.At(4, 8), kWhite);
  EXPECT_EQ(rim.At(8, 8), kWhite);

  // A line two pixels wide survives whole.
  TBitmap32 line(9, 8, kWhite);
  for (int y = 0; y < 8; ++y) line.At(4, y) = line.At(5, y) = kBlack;
  EXPECT_EQ(Pen_and_Ink(line, 128, false), line);
}

TEST(PenAndInk, EverythingInkedLeavesAFrameInTheSourceColours) {
  const TBitmap32 in = RandomPicture(7, 5, 5);
  for (int t : {254, 255}) {
    TBitmap32 frame(7, 5, kWhite);
    TBitmap32 coloured = frame;
    for (int y = 0; y < 5; ++y)
      for (int x = 0; x < 7; ++x)
        if (x == 0 || y == 0 || x == 6 || y == 4) {
          frame.At(x, y) = kBlack;
          const Pixel s = in.At(x, y);
          coloured.At(x, y) = Pixel{s.b, s.g, s.r, 255};
        }
    EXPECT_EQ(Pen_and_Ink(in, t, false), frame);
    EXPECT_EQ(Pen_and_Ink(in, t, true), coloured);
  }
}

// Under 3 rows or columns nothing is inside: the result is the thresholded picture.
TEST(PenAndInk, MatchesThePlainStepsAtEverySize) {
  unsigned seed = 60;
  for (auto [w, h] : kSizes)
    for (int t : {0, 90, 128, 254})
      for (bool colour : {false, true}) {
        const TBitmap32 in = RandomPicture(w, h, ++seed, 3);
        EXPECT_EQ(Pen_and_Ink(in, t, colour), PlainPenAndInk(in, t, colour))
            << w << "x" << h << " t" << t << " colour " << colour;
      }
  const TBitmap32 large = RandomPicture(kLargeWidth, kLargeHeight, 9, 3);
  for (bool colour : {false, true})
    EXPECT_EQ(Pen_and_Ink(large, 128, colour), PlainPenAndInk(large, 128, colour));
}

}  // namespace
}  // namespace quillane
