// Pop art and abstract: the kernel-and-gradient filter with each one's gradient and defaults.
#include <gtest/gtest.h>

#include <limits>

#include "effects/paint/abstract.h"
#include "effects/paint/pop_art.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

const Kernel kPopArt{-1, -2, -1, 0, 0, 0, 1, 2, 1};
const Pixel kWhite{255, 255, 255, 255};

// The levels down the middle column (vertical) or along the middle row of the result on a
// 6 x 6 picture of level first before the middle and second after it.
std::vector<int> AcrossEdge(TBitmap32 (*effect)(const TBitmap32&, const Kernel&), const Kernel& k,
                            bool vertical, std::uint8_t first, std::uint8_t second) {
  TBitmap32 b(6, 6);
  for (int y = 0; y < 6; ++y)
    for (int x = 0; x < 6; ++x) {
      const std::uint8_t v = (vertical ? y : x) < 3 ? first : second;
      b.At(x, y) = Pixel{v, v, v, 255};
    }
  const TBitmap32 out = effect(b, k);
  std::vector<int> levels;
  for (int i = 0; i < 6; ++i) levels.push_back((vertical ? out.At(2, i) : out.At(i, 2)).g);
  return levels;
}

TEST(KernelGradient, PopArtDrawsBrighteningDownAndRightAbstractDarkeningRight) {
  const Kernel abstract{-1, -1, -1, 0, 0, 0, -1, -1, -1};
  const TBitmap32 flat(5, 4, Pixel{9, 99, 199, 255});
  EXPECT_EQ(popart(flat, kPopArt), TBitmap32(5, 4, kWhite));
  EXPECT_EQ(doabstract(flat, abstract), TBitmap32(5, 4, kWhite));
  EXPECT_EQ(doabstract(flat, Kernel{0, 0, 0, 0, 1}), TBitmap32(5, 4, Pixel{246, 156, 56, 255}));
  const std::vector<int> popLine{255, 255, 55, 55, 255, 255}, none(6, 255);
  for (bool vertical : {true, false}) {
    EXPECT_EQ(AcrossEdge(popart, kPopArt, vertical, 100, 150), popLine);
    EXPECT_EQ(AcrossEdge(popart, kPopArt, vertical, 150, 100), none);
    EXPECT_EQ(AcrossEdge(doabstract, abstract, vertical, 100, 150), none);
  }
  EXPECT_EQ(AcrossEdge(doabstract, abstract, false, 150, 100),
            (std::vector<int>{255, 255, 105, 105, 255, 255}));
  EXPECT_EQ(AcrossEdge(doabstract, abstract, true, 150, 100), none);
}

TEST(KernelGradient, SmallPicturesRepeatTheirInnerLineInverted) {
  TBitmap32 twoHigh(4, 2, Pixel{1, 2, 3, 0});
  for (int x = 0; x < 4; ++x) twoHigh.At(x, 1) = Pixel{10, 20, 30, 40};
  EXPECT_EQ(popart(twoHigh, kPopArt), TBitmap32(4, 2, Pixel{245, 235, 225, 255}));
  TBitmap32 twoWide(2, 3, Pixel{1, 2, 3, 0});
  twoWide.At(1, 1) = Pixel{10, 20, 30, 40};
  EXPECT_EQ(popart(twoWide, kPopArt), TBitmap32(2, 3, Pixel{245, 235, 225, 255}));
  EXPECT_EQ(popart(TBitmap32(5, 1, Pixel{1, 2, 3, 4}), kPopArt),
            TBitmap32(5, 1, Pixel{254, 253, 252, 255}));
}

TEST(KernelGradient, RowsOfBytesGiveTheReferenceBytes) {
  constexpr std::int64_t kMax = std::numeric_limits<std::int32_t>::max();
  for (Gradient g : {Gradient::LeftMinusRight, Gradient::RightMinusLeftSobel})
    for (const Kernel& k :
         {kPopArt, Kernel{-1, -1, -1, 0, 0, 0, -1, -1, -1}, Kernel{0, 0, 0, 0, 1},
          Kernel{-3, 17, 0, 0, -100, 8}, Kernel{kMax, 0, 0, 0, 0, 0, 0, 0, -kMax}})
      for (auto [w, h] : {std::pair{29, 13}, {3, 3}, {1, 4}, {0, 0}})
        ASSERT_EQ(KernelGradientFilter(RandomPicture(w, h, 5), k, g),
                  KernelGradientReference(RandomPicture(w, h, 5), k, g));
  // Sums beyond 32 bits clamp: any channel that is not 0 where the weight is gives 255, drawn
  // black.
  EXPECT_EQ(popart(TBitmap32(3, 3, Pixel{0, 1, 2, 255}), Kernel{kMax, kMax, kMax}),
            TBitmap32(3, 3, Pixel{255, 0, 0, 255}));
}

}  // namespace
}  // namespace quillane
