// Water colour and Brume on every path they can take (vectors or not, one band or many) against
// their plain references, on pictures whose sizes leave odd remainders everywhere.
#include <gtest/gtest.h>

#include <algorithm>
#include <utility>

#include "effects/paint/brume.h"
#include "effects/paint/water_color.h"
#include "tests/imaging/fast_path_support.h"
#include "tests/reference/paint_reference.h"

namespace quillane {
namespace {

// Many bands: up to 7 of them, whatever the picture's size.
const std::pair<VectorWidth, RowSplit> kPaths[] = {{VectorWidth::Avx512, {}},
                                                   {VectorWidth::Plain, {}},
                                                   {VectorWidth::Avx512, {7, 1}},
                                                   {VectorWidth::Plain, {7, 1}}};

const std::pair<int, int> kSizes[] = {{1, 1},  {1, 9},  {9, 1},  {3, 3},  {4, 3},   {11, 5},
                                      {9, 13}, {17, 4}, {34, 6}, {45, 2}, {4101, 5}};

TEST(PaintFastPaths, WaterColorGivesTheReferenceBytes) {
  for (const auto& [widest, split] : kPaths)
    for (auto [w, h] : kSizes) {
      const FastPathVariant variant(widest, split);
      const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * 31 + h));
      for (int cycles : {1, 2, 5}) {
        if (w > 100 && cycles == 5) continue;
        ASSERT_EQ(WaterColor(in, cycles), WaterColorReference(in, cycles))
            << w << "x" << h << " cycles " << cycles << " " << WidthName(widest);
      }
    }
}

TEST(PaintFastPaths, EachPassGivesItsFormulaAndLeavesTheFrame) {
  const Pixel untouched{1, 2, 3, 4};
  for (const auto& [widest, split] : kPaths)
    for (int w = 3; w < 44; w += 5) {
      const FastPathVariant variant(widest, split);
      // Random bytes, and the extremes that make the sharpening clamp both ways.
      Bitmap32 in = RandomPicture(w, 4, static_cast<unsigned>(w));
      for (int x = 0; x < w; x += 2) in.At(x, 1) = in.At(x, 2) = Pixel{0, 255, 0, 9};
      Bitmap32 sharp(w, 4, untouched), median(w, 4, untouched);
      SharpenPass(in, sharp);
      MedianPass(in, median);
      for (int y = 0; y < 4; ++y)
        for (int x = 0; x < w; ++x) {
          if (y == 0 || y == 3 || x == 0 || x == w - 1) {
            ASSERT_EQ(sharp.At(x, y), untouched);
            ASSERT_EQ(median.At(x, y), untouched);
            continue;
          }
          ASSERT_EQ(sharp.At(x, y).a, in.At(x, y).a);
          ASSERT_EQ(median.At(x, y).a, in.At(x, y).a);
          for (std::uint8_t Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
            const auto at = [&](int dx, int dy) { return int{in.At(x + dx, y + dy).*c}; };
            const int v = 5 * at(0, 0) - at(0, -1) - at(-1, 0) - at(1, 0) - at(0, 1);
            ASSERT_EQ(sharp.At(x, y).*c, std::clamp(v, 0, 255)) << w << " " << x << "," << y;
            int block[9];
            for (int i = 0; i < 9; ++i) block[i] = at(i % 3 - 1, i / 3 - 1);
            SelectionSort(block, 8);
            ASSERT_EQ(median.At(x, y).*c, block[4]) << w << " " << x << "," << y;
          }
        }
    }
}

TEST(PaintFastPaths, BrumeDrawsWhatThePlainLoopDraws) {
  for (const auto& [widest, split] : kPaths)
    for (auto [w, h] : kSizes)
      for (int scope : {1, 3, 10}) {
        const FastPathVariant variant(widest, split);
        const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w + h));
        std::uint32_t fast = 0xDEADBEEF, plain = 0xDEADBEEF;
        for (int run = 0; run < 2; ++run)  // the second run goes on from the first one's seed
          ASSERT_EQ(Brume(in, scope, fast), BrumeReference(in, scope, plain))
              << w << "x" << h << " scope " << scope << " " << WidthName(widest);
        ASSERT_EQ(fast, plain);
      }
}

}  // namespace
}  // namespace quillane
