#include "effects/paint/water_color.h"

#include <gtest/gtest.h>

#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

TEST(WaterColor, FastPassesGiveTheSelectionSortBytesAndKeepTheFrame) {
  const TBitmap32 in = RandomPicture(40, 9, 11);
  TBitmap32 median(40, 9);
  MedianPass(in, median);
  for (int y = 1; y < 8; ++y)
    for (int x = 1; x < 39; ++x)
      for (std::uint8_t Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
        int block[9];
        for (int i = 0; i < 9; ++i) block[i] = in.At(x + i % 3 - 1, y + i / 3 - 1).*c;
        SelectionSort(block, 8);
        ASSERT_EQ(median.At(x, y).*c, block[4]) << x << "," << y;
      }
  for (int n = 1; n <= 5; ++n) {
    const TBitmap32 out = watercolor(in, n);
    ASSERT_EQ(out, WaterColorReference(in, n)) << n;
    for (int x = 0; x < 40; ++x) EXPECT_EQ(out.At(x, 8), in.At(x, 8));
    for (int y = 0; y < 9; ++y) EXPECT_EQ(out.At(0, y), in.At(0, y));
  }
  for (auto [w, h] : {std::pair{0, 0}, {1, 6}, {6, 1}, {2, 5}, {5, 2}})
    EXPECT_EQ(watercolor(RandomPicture(w, h, 3), 3), RandomPicture(w, h, 3));
}

}  // namespace
}  // namespace quillane
