// The kernel-and-gradient filter behind pop art and abstract.
#include <gtest/gtest.h>

#include <limits>

#include "effects/paint/pop_art.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

const Kernel kPopArt{-1, -2, -1, 0, 0, 0, 1, 2, 1};
TEST(KernelGradient, SmallPicturesRepeatTheirInnerLineInverted) {
  Bitmap32 twoHigh(4, 2, Pixel{1, 2, 3, 0});
  for (int x = 0; x < 4; ++x) twoHigh.At(x, 1) = Pixel{10, 20, 30, 40};
  EXPECT_EQ(PopArt(twoHigh, kPopArt), Bitmap32(4, 2, Pixel{245, 235, 225, 255}));
  Bitmap32 twoWide(2, 3, Pixel{1, 2, 3, 0});
  twoWide.At(1, 1) = Pixel{10, 20, 30, 40};
  EXPECT_EQ(PopArt(twoWide, kPopArt), Bitmap32(2, 3, Pixel{245, 235, 225, 255}));
  EXPECT_EQ(PopArt(Bitmap32(5, 1, Pixel{1, 2, 3, 4}), kPopArt),
            Bitmap32(5, 1, Pixel{254, 253, 252, 255}));
}

// Kernels too heavy for 32-bit sums take the plain loop, whose sums clamp: any channel that is
// not 0 where the weight is gives 255, drawn black.
TEST(KernelGradient, SumsBeyondThirtyTwoBitsClamp) {
  constexpr std::int64_t kMax = std::numeric_limits<std::int32_t>::max();
  const Kernel opposite{kMax, 0, 0, 0, 0, 0, 0, 0, -kMax};
  for (Gradient g : {Gradient::LeftMinusRight, Gradient::RightMinusLeftSobel})
    ASSERT_EQ(KernelGradientFilter(RandomPicture(29, 13, 5), opposite, g),
              KernelGradientPlain(RandomPicture(29, 13, 5), opposite, g));
  EXPECT_EQ(PopArt(Bitmap32(3, 3, Pixel{0, 1, 2, 255}), Kernel{kMax, kMax, kMax}),
            Bitmap32(3, 3, Pixel{255, 0, 0, 255}));
}

}  // namespace
}  // namespace quillane
