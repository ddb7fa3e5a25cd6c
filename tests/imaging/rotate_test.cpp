#include "imaging/rotate.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>

#include "imaging/numeric.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

constexpr double kClockwise = -std::numbers::pi / 2;
constexpr double kAnticlockwise = std::numbers::pi / 2;

// The turn the slow way: both canvases built, every pixel through sine and cosine.
std::optional<Bitmap32> ReferenceRotate(const Bitmap32& s, int cx, int cy, double theta) {
  const int w = s.Width(), h = s.Height();
  const Extended d = std::sqrt(static_cast<Extended>(h * h + w * w));
  const int padX = Round((d - w) / 2), padY = Round((d - h) / 2);
  Bitmap32 a(w + 2 * padX, h + 2 * padY, kRotationFill);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) a.At(x + padX, y + padY) = s.At(x, y);
  const int ax = cx + padX, ay = cy + padY;
  const Extended sn = std::sin(static_cast<Extended>(theta));
  const Extended c = std::cos(static_cast<Extended>(theta));
  Bitmap32 b(a.Width(), a.Height(), kRotationFill);
  int top = -1, left = -1;
  for (int y = 0; y < b.Height(); ++y)
    for (int x = 0; x < b.Width(); ++x) {
      const Extended dx = x - ax, dy = y - ay;
      const int sx = Round(dx * c - dy * sn) + ax, sy = Round(dx * sn + dy * c) + ay;
      if (sx >= 0 && sx < a.Width() && sy >= 0 && sy < a.Height()) b.At(x, y) = a.At(sx, sy);
      if (!(b.At(x, y) == kRotationFill)) {
        if (top < 0) top = y;
        if (left < 0 || x < left) left = x;
      }
    }
  top = std::max(top, 0);
  left = std::max(left, 0);
  if (b.Width() - 2 * left < 1 || b.Height() - 2 * top < 1) return std::nullopt;
  Bitmap32 result(b.Width() - 2 * left, b.Height() - 2 * top);
  for (int y = 0; y < result.Height(); ++y)
    for (int x = 0; x < result.Width(); ++x) result.At(x, y) = b.At(left + x, top + y);
  return result;
}

std::optional<Bitmap32> Turn(const Bitmap32& s, QuarterTurn turn) {
  return RotatePicture(s, RotationCentre(s.Width()), RotationCentre(s.Height()), turn);
}

std::pair<int, int> SizeOf(const Bitmap32& b) {
  return {b.Width(), b.Height()};
}

TEST(RotatePicture, SizesOfQuarterTurns) {
  const struct {
    int w, h;
    QuarterTurn turn;
    int expectW, expectH;
  } cases[] = {
      {640, 480, QuarterTurn::Clockwise, 478, 640},
      {640, 480, QuarterTurn::Anticlockwise, 480, 638},
      {521, 346, QuarterTurn::Clockwise, 345, 520},
      {521, 346, QuarterTurn::Anticlockwise, 347, 520},
      {101, 57, QuarterTurn::Clockwise, 57, 101},
      {101, 57, QuarterTurn::Anticlockwise, 57, 101},
  };
  for (const auto& c : cases) {
    const std::optional<Bitmap32> r = Turn(RandomPicture(c.w, c.h, 1), c.turn);
    ASSERT_TRUE(r) << c.w << "x" << c.h;
    EXPECT_EQ(SizeOf(*r), std::pair(c.expectW, c.expectH)) << c.w << "x" << c.h;
  }
}

TEST(RotatePicture, MatchesTheCanvasReference) {
  // Random content, some of it in the fill colour: the trim depends on what the picture holds.
  auto withFill = [](Bitmap32 b, int variant) {
    for (int y = 0; y < b.Height(); ++y)
      for (int x = 0; x < b.Width(); ++x) {
        const bool fill = variant == 1   ? x < b.Width() / 2
                          : variant == 2 ? y + 1 < b.Height()
                                         : variant == 3;
        if (fill) b.At(x, y) = kRotationFill;
      }
    return b;
  };
  std::vector<std::pair<int, int>> sizes;
  for (int w = 1; w <= 9; ++w)
    for (int h = 1; h <= 9; ++h) sizes.emplace_back(w, h);
  for (auto s : {std::pair{1, 40}, {40, 1}, {2, 17}, {17, 2}, {33, 70}, {70, 33}, {64, 64}})
    sizes.push_back(s);
  for (auto [w, h] : sizes)
    for (int variant = 0; variant <= 3; ++variant) {
      const Bitmap32 s = withFill(RandomPicture(w, h, static_cast<unsigned>(w * 100 + h)), variant);
      for (auto [cx, cy] : {std::pair{RotationCentre(w), RotationCentre(h)}, {0, 0}, {w, h - 1}})
        for (QuarterTurn turn : {QuarterTurn::Clockwise, QuarterTurn::Anticlockwise}) {
          const double theta = turn == QuarterTurn::Clockwise ? kClockwise : kAnticlockwise;
          ASSERT_TRUE(RotatePicture(s, cx, cy, turn) == ReferenceRotate(s, cx, cy, theta))
              << w << "x" << h << " variant " << variant << " centre " << cx << "," << cy;
        }
    }
}

}  // namespace
}  // namespace quillane
