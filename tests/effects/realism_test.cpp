#include "effects/paint/realism.h"

#include <gtest/gtest.h>

#include <limits>

#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

constexpr std::int64_t kMax = std::numeric_limits<std::int32_t>::max();
constexpr std::int64_t kMin = std::numeric_limits<std::int32_t>::min();
const Kernel kDefault{1, 2, 1, 0, 0, 0, -1, -1, -1};

TEST(Realism, SumsBeyondThirtyTwoBitsClamp) {
  Bitmap32 sparse(3, 3, Pixel{0, 0, 0, 255});
  sparse.At(0, 0) = Pixel{0, 1, 255, 255};
  const Kernel heavy{kMax, kMax, kMax, kMax, kMax, kMax, kMax, kMax, kMax};
  EXPECT_EQ(realism(sparse, heavy).At(1, 1), (Pixel{0, 255, 255, 255}));
  Kernel negative = heavy;
  negative[0] = kMin;
  EXPECT_EQ(realism(sparse, negative).At(1, 1), (Pixel{0, 0, 0, 255}));
}

// Every caller divides by 1; other divisors take the plain loop, and pictures without an
// interior come back as they were.
TEST(Realism, DivisorsAndPicturesWithoutInterior) {
  const Bitmap32 noise = RandomPicture(37, 11, 99);
  EXPECT_EQ(Convolve(noise, kDefault, 3), ConvolvePlain(noise, kDefault, 3));
  for (auto [w, h] : {std::pair{0, 0}, {1, 6}, {6, 1}, {2, 5}, {5, 2}})
    EXPECT_EQ(realism(RandomPicture(w, h, 99), kDefault), RandomPicture(w, h, 99));
}

}  // namespace
}  // namespace quillane
