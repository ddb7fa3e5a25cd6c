#include "effects/paint/realism.h"

#include <gtest/gtest.h>

#include <limits>

#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

constexpr std::int64_t kMax = std::numeric_limits<std::int32_t>::max();
constexpr std::int64_t kMin = std::numeric_limits<std::int32_t>::min();
const Kernel kDefault{1, 2, 1, 0, 0, 0, -1, -1, -1};

TBitmap32 Noise(int w, int h) {
  return RandomPicture(w, h, 99);
}

// The middle column of the default kernel's result on rows 0..2 of level top and 3..5 of
// level bottom.
std::vector<int> AcrossEdge(std::uint8_t top, std::uint8_t bottom) {
  TBitmap32 b(5, 6, Pixel{top, top, top, 255});
  for (int y = 3; y < 6; ++y)
    for (int x = 0; x < 5; ++x) b.At(x, y) = Pixel{bottom, bottom, bottom, 255};
  const TBitmap32 out = realism(b, kDefault);
  std::vector<int> levels;
  for (int y = 0; y < 6; ++y) levels.push_back(out.At(2, y).g);
  return levels;
}

TEST(Realism, KernelsFromTheDefaultToTheLargestCells) {
  const TBitmap32 flat(6, 5, Pixel{10, 120, 250, 255});
  EXPECT_EQ(realism(flat, kDefault), flat);
  EXPECT_EQ(AcrossEdge(200, 50), (std::vector<int>{200, 200, 255, 255, 50, 50}));
  EXPECT_EQ(AcrossEdge(50, 200), (std::vector<int>{50, 50, 0, 0, 200, 200}));

  const TBitmap32 noise = Noise(9, 7);
  TBitmap32 opaqueInside = noise;
  for (int y = 1; y < 6; ++y)
    for (int x = 1; x < 8; ++x) opaqueInside.At(x, y).a = 255;
  EXPECT_EQ(realism(noise, {0, 0, 0, 0, 1}), opaqueInside);
  EXPECT_EQ(realism(noise, {}).At(4, 3), (Pixel{0, 0, 0, 255}));
  EXPECT_EQ(realism(noise, {}).At(0, 3), noise.At(0, 3));

  // Sums far beyond 32 bits clamp like any other.
  TBitmap32 sparse(3, 3, Pixel{0, 0, 0, 255});
  sparse.At(0, 0) = Pixel{0, 1, 255, 255};
  const Kernel heavy{kMax, kMax, kMax, kMax, kMax, kMax, kMax, kMax, kMax};
  EXPECT_EQ(realism(sparse, heavy).At(1, 1), (Pixel{0, 255, 255, 255}));
  Kernel negative = heavy;
  negative[0] = kMin;
  EXPECT_EQ(realism(sparse, negative).At(1, 1), (Pixel{0, 0, 0, 255}));
}

TEST(Realism, SixteenBitRowSumsGiveTheReferenceBytes) {
  const TBitmap32 noise = Noise(37, 11);
  for (const Kernel& k : {kDefault, Kernel{128}, Kernel{-50, 30, 0, 7, -9, 0, 0, 32}})
    EXPECT_EQ(realism(noise, k), ConvolveReference(noise, k, 1));
  EXPECT_EQ(Convolve(noise, kDefault, 3), ConvolveReference(noise, kDefault, 3));
  for (auto [w, h] : {std::pair{0, 0}, {1, 6}, {6, 1}, {2, 5}, {5, 2}})
    EXPECT_EQ(realism(Noise(w, h), kDefault), Noise(w, h));
}

}  // namespace
}  // namespace quillane
