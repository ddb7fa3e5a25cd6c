#include "imaging/bitmap32.h"

#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <limits>

namespace quillane {
namespace {

// A picture whose every pixel names its own position: B = x, G = y, R = 7, alpha 255.
Bitmap32 Numbered(int w, int h, std::uint8_t alpha = 255) {
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x)
      b.At(x, y) = Pixel{static_cast<std::uint8_t>(x), static_cast<std::uint8_t>(y), 7, alpha};
  return b;
}

TEST(Bitmap32, NewAndDegenerateSizesAreEmpty) {
  const Bitmap32 fresh;
  EXPECT_EQ(fresh.Width(), 0);
  EXPECT_EQ(fresh.Height(), 0);
  EXPECT_TRUE(fresh.Empty());
  for (auto [w, h] : {std::pair{-3, 5}, {5, -1}, {0, 4}, {4, 0}, {INT_MIN, INT_MIN}}) {
    const Bitmap32 b(w, h);
    EXPECT_EQ(b.Width(), 0) << w << "x" << h;
    EXPECT_EQ(b.Height(), 0) << w << "x" << h;
    EXPECT_EQ(b.PixelCount(), 0u);
  }
  EXPECT_THROW(Bitmap32(1 << 15, 1 << 14), std::length_error);
}

TEST(Bitmap32, NewPixelsAreZeroAndResizeDiscardsContent) {
  Bitmap32 b(3, 2, Pixel{1, 2, 3, 4});
  EXPECT_EQ(b.At(2, 1), (Pixel{1, 2, 3, 4}));
  b.SetSize(4, 3);
  EXPECT_EQ(b, Bitmap32(4, 3, Pixel{0, 0, 0, 0}));
  b.SetSize(-1, 3);
  EXPECT_TRUE(b.Empty());
  EXPECT_EQ(b.Height(), 0);
}

TEST(Bitmap32, RowAccessOutsideTheRowsThrows) {
  Bitmap32 b(4, 3);
  const Bitmap32& cb = b;
  EXPECT_EQ(cb.ScanLine(2), b.ScanLine(0) + 8);
  for (int y : {-1, 3, INT_MIN, INT_MAX}) {
    EXPECT_THROW(b.ScanLine(y), ScanLineError) << y;
    EXPECT_THROW(cb.ScanLine(y), ScanLineError) << y;
  }
  try {
    Bitmap32().ScanLine(0);
    FAIL() << "an empty bitmap has no rows";
  } catch (const ScanLineError& e) {
    EXPECT_STREQ(e.what(), "Scan line index out of range");
  }
  // Rows are contiguous and follow each other without padding.
  EXPECT_EQ(b.ScanLine(0), b.Data());
  EXPECT_THROW(b.At(4, 0), std::out_of_range);
  EXPECT_THROW(b.At(-1, 0), std::out_of_range);
}

TEST(ColorRef, RedIsTheLowestByte) {
  EXPECT_EQ(PixelFromColorRef(0x00332211), (Pixel{0x33, 0x22, 0x11, 255}));
  EXPECT_EQ(PixelFromColorRef(0xFF332211, 9), (Pixel{0x33, 0x22, 0x11, 9}));
  EXPECT_EQ(ColorRefFromPixel(Pixel{0x33, 0x22, 0x11, 0x80}), 0x00332211u);
}

TEST(SetAlphaChannel, SetsAlphaOnlyAndEmptyIsANoOp) {
  Bitmap32 b = Numbered(5, 3, 0);
  SetAlphaChannel(b, 200);
  EXPECT_EQ(b, Numbered(5, 3, 200));
  Bitmap32 empty;
  SetAlphaChannel(empty, 255);
  EXPECT_TRUE(empty.Empty());
  // Stretches already holding the value are left as they are; a single pixel that does not,
  // anywhere (first, middle and last stretch, the last one short), is set.
  for (const auto& [x, y] : {std::pair{0, 0}, {57, 61}, {99, 99}}) {
    Bitmap32 opaque = Numbered(100, 100, 255);
    opaque.At(x, y).a = 0;
    SetAlphaChannel(opaque, 255);
    EXPECT_EQ(opaque, Numbered(100, 100, 255)) << x << ", " << y;
  }
}

Pixel Over(Pixel overlay, Pixel target) {
  Bitmap32 t(1, 1, target);
  Bitmap32(1, 1, overlay).DrawOver(0, 0, t);
  return t.At(0, 0);
}

TEST(DrawOver, PixelRules) {
  // Half-transparent red over opaque white.
  EXPECT_EQ(Over(Pixel{0, 0, 255, 128}, Pixel{255, 255, 255, 255}), (Pixel{127, 127, 255, 255}));
  // A transparent overlay leaves the target, however transparent the target is itself.
  EXPECT_EQ(Over(Pixel{9, 9, 9, 0}, Pixel{10, 20, 30, 255}), (Pixel{10, 20, 30, 255}));
  EXPECT_EQ(Over(Pixel{9, 9, 9, 0}, Pixel{10, 20, 30, 1}), (Pixel{10, 20, 30, 1}));
  // Both transparent: white with alpha 0.
  EXPECT_EQ(Over(Pixel{9, 9, 9, 0}, Pixel{10, 20, 30, 0}), (Pixel{255, 255, 255, 0}));
  // Opaque overlay, or transparent target: the overlay pixel with its own alpha.
  EXPECT_EQ(Over(Pixel{1, 2, 3, 255}, Pixel{10, 20, 30, 77}), (Pixel{1, 2, 3, 255}));
  EXPECT_EQ(Over(Pixel{1, 2, 3, 77}, Pixel{10, 20, 30, 0}), (Pixel{1, 2, 3, 77}));
  // Both partial: d = 255 (50 + 100) - 5000 = 33250; weights 100 * 205 and 255 * 50.
  // B: (20500 * 200 + 12750 * 10) / 33250 = 127.1; G: (20500 * 0 + 12750 * 255) / 33250 = 97.8;
  // R: (20500 * 255 + 12750 * 255) / 33250 = 255; A: 33250 / 255 = 130.4.
  EXPECT_EQ(Over(Pixel{10, 255, 255, 50}, Pixel{200, 0, 255, 100}), (Pixel{127, 97, 255, 130}));
}

// Places a numbered overlay of ow by oh at (x, y) of an opaque gray 6 by 5 target and checks
// that exactly the overlapping target pixels took the overlay pixel that lands on them.
void ExpectPlacement(int ow, int oh, int x, int y) {
  const Pixel ground{50, 50, 50, 255};
  Bitmap32 target(6, 5, ground);
  Numbered(ow, oh).DrawOver(x, y, target);
  for (int ty = 0; ty < 5; ++ty)
    for (int tx = 0; tx < 6; ++tx) {
      const long long ox = static_cast<long long>(tx) - x, oy = static_cast<long long>(ty) - y;
      const bool inside = ox >= 0 && oy >= 0 && ox < ow && oy < oh;
      const Pixel expected =
          inside ? Pixel{static_cast<std::uint8_t>(ox), static_cast<std::uint8_t>(oy), 7, 255}
                 : ground;
      ASSERT_EQ(target.At(tx, ty), expected)
          << ow << "x" << oh << " at " << x << "," << y << ": target " << tx << "," << ty;
    }
}

TEST(DrawOver, ClipsAtEverySide) {
  // {width, height, x, y}: inside, over each corner, larger than the target on every side, just
  // off each edge, far away (no overflow), and an empty overlay.
  const int cases[][4] = {{3, 3, 1, 1},
                          {3, 3, -1, -2},
                          {3, 3, 4, 3},
                          {3, 3, -2, 3},
                          {3, 3, 5, -1},
                          {10, 9, -2, -3},
                          {3, 3, -3, 0},
                          {3, 3, 6, 0},
                          {3, 3, 0, -3},
                          {3, 3, 0, 5},
                          {3, 3, INT_MAX, INT_MAX},
                          {3, 3, INT_MIN, INT_MIN},
                          {0, 0, 0, 0}};
  for (const auto& c : cases) ExpectPlacement(c[0], c[1], c[2], c[3]);
  // An empty target stays empty.
  Bitmap32 target;
  Numbered(3, 3).DrawOver(0, 0, target);
  Numbered(3, 3).DrawOver(-1, -1, target);
  EXPECT_TRUE(target.Empty());
}

TEST(ResampleNearest, SizesOfZeroOrBelowOrNotANumberGiveEmpty) {
  const long double nan = std::numeric_limits<long double>::quiet_NaN();
  const long double inf = std::numeric_limits<long double>::infinity();
  const long double factors[][2] = {{0.0L, 1.0L},  {1.0L, 0.0L}, {-1.0L, 1.0L},
                                    {1.0L, -2.0L}, {nan, 1.0L},  {1.0L, nan},
                                    {inf, 1.0L},   {1.0L, -inf}, {0.1L, 1.0L}};
  for (auto [hf, wf] : factors) {
    Bitmap32 b = Numbered(6, 4);
    ResampleNearest(b, hf, wf);
    EXPECT_TRUE(b.Empty()) << hf << " " << wf;
    EXPECT_EQ(b.Height(), 0);
  }
  Bitmap32 narrow = Numbered(1, 4);
  ResampleNearest(narrow, 1.0L, 0.9L);
  EXPECT_TRUE(narrow.Empty());
  Bitmap32 empty;
  ResampleNearest(empty, 2.0L, 2.0L);
  EXPECT_TRUE(empty.Empty());
}

TEST(ResampleNearest, ARequestBeyondTheSizeLimitLeavesThePicture) {
  Bitmap32 b = Numbered(1000, 1000);
  EXPECT_THROW(ResampleNearest(b, 100.0L, 100.0L), std::length_error);
  EXPECT_EQ(b, Numbered(1000, 1000));
}

// Worked by hand: target column x copies source column floor(x * W / W'), row y likewise.
TEST(ResampleNearest, EachTargetPixelCopiesTheSourcePixelItsPositionFallsIn) {
  // Two columns to five: the targets start 0, 0.4, 0.8, 1.2 and 1.6 source columns in.
  Bitmap32 pair = Numbered(2, 1);
  ResampleNearest(pair, 1.0L, 2.5L);
  ASSERT_EQ(pair.Width(), 5);
  for (int x = 0; x < 5; ++x) EXPECT_EQ(pair.At(x, 0).b, x < 3 ? 0 : 1) << x;

  // The image size dialog's example: 521 by 346 to 400 wide with the aspect held is 399 by 266
  // (the factors are double quotients, 400 / 521 rounded downward).
  Bitmap32 photo = Numbered(521, 346);
  ResampleNearest(photo, static_cast<long double>(266.0 / 346.0),
                  static_cast<long double>(400.0 / 521.0));
  ASSERT_EQ(photo.Width(), 399);
  ASSERT_EQ(photo.Height(), 266);
  const struct {
    int x, y, sourceX, sourceY;
  } worked[] = {{2, 2, 2, 2}, {3, 1, 3, 1}, {398, 265, 519, 344}, {200, 133, 261, 173}};
  for (const auto& c : worked) {
    EXPECT_EQ(photo.At(c.x, c.y).b, static_cast<std::uint8_t>(c.sourceX)) << c.x;
    EXPECT_EQ(photo.At(c.x, c.y).g, static_cast<std::uint8_t>(c.sourceY)) << c.y;
  }
}

// The same rule for every pixel at other factors: unit, growing, shrinking, mixed, and two
// columns of 101.
TEST(ResampleNearest, EveryTargetPixelFollowsTheRule) {
  const long double factors[][2] = {{1.0L, 1.0L},   {2.0L, 2.0L},  {0.5L, 0.5L},
                                    {1.37L, 0.73L}, {0.3L, 2.49L}, {1.0L, 0.02L}};
  constexpr int w = 101, h = 57;
  for (auto [hf, wf] : factors) {
    Bitmap32 b = Numbered(w, h);
    ResampleNearest(b, hf, wf);
    const int nw = static_cast<int>(w * wf), nh = static_cast<int>(h * hf);
    ASSERT_EQ(b.Width(), nw);
    ASSERT_EQ(b.Height(), nh);
    for (int y = 0; y < nh; ++y)
      for (int x = 0; x < nw; ++x)
        ASSERT_EQ(b.At(x, y), (Pixel{static_cast<std::uint8_t>(x * w / nw),
                                     static_cast<std::uint8_t>(y * h / nh), 7, 255}))
            << hf << " " << wf << " at " << x << "," << y;
  }
}

}  // namespace
}  // namespace quillane
