// What the comparisons of fast paths against their plain references share: the picture sizes
// that break vector loops and bands, and the ways a pass may be split and dispatched.
#pragma once

#include <gtest/gtest.h>

#include <utility>

#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/vector_dispatch.h"
#include "tests/imaging/random_picture.h"

namespace quillane {

// Single rows and columns, widths either side of the 8-, 16- and 32-pixel vectors, the 256-pixel
// rounds and the 1024-pixel stretches, heights below the number of bands, and tall pictures for
// the half- and third-size copies.
inline constexpr std::pair<int, int> kAwkwardSizes[] = {
    {1, 1},    {1, 9},    {9, 1},    {2, 2},    {2, 5},    {5, 2},  {3, 3},    {4, 3},
    {3, 9},    {9, 4},    {10, 3},   {17, 2},   {18, 5},   {19, 3}, {33, 4},   {35, 3},
    {33, 31},  {40, 6},   {45, 8},   {66, 7},   {71, 12},  {3, 70}, {101, 13}, {259, 4},
    {300, 11}, {1026, 3}, {1027, 4}, {1060, 6}, {100, 100}};

// Soft gradients with a little grain: edge maps with the mid-range values (and the exact halves
// of the gray value) that noise, whose edge map is all 0 and 255, lacks, and the colours near
// gray where hue and saturation meet exact halves most.
inline TBitmap32 SoftPicture(int w, int h, unsigned seed) {
  std::mt19937 rng(seed);
  TBitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto channel = [&](int slope) {
        return static_cast<std::uint8_t>(ClampByte(90 + slope * (x + 2 * y) % 110 + rng() % 9));
      };
      b.At(x, y) = Pixel{channel(1), channel(2), channel(3), static_cast<std::uint8_t>(rng())};
    }
  return b;
}

// Sets the AVX2 choice (and optionally the row split) while it lives, then restores both.
class FastPathVariant {
 public:
  explicit FastPathVariant(bool avx2, RowSplit split = {}) {
    SetRowSplit(split);
    SetAvx2Allowed(avx2);
  }
  ~FastPathVariant() {
    SetRowSplit({});
    SetAvx2Allowed(true);
  }
};

// Runs fn in one band with AVX2, in many bands with AVX2 and in many bands without it, stopping
// at the first fatal failure; the failure messages say which.
template <typename Fn>
void ForEachSplit(Fn&& fn) {
  const std::pair<RowSplit, bool> variants[] = {
      {{1, kParallelThreshold}, true}, {{5, 0}, true}, {{3, 0}, false}};
  for (const auto& [split, avx2] : variants) {
    SCOPED_TRACE(::testing::Message() << "bands " << split.threads << " avx2 " << avx2);
    const FastPathVariant variant(avx2, split);
    fn();
    if (::testing::Test::HasFatalFailure()) return;
  }
}

// Runs fn with and without the AVX2 variants.
template <typename Fn>
void ForEachAvx2(Fn&& fn) {
  for (const bool avx2 : {true, false}) {
    SCOPED_TRACE(::testing::Message() << "avx2 " << avx2);
    const FastPathVariant variant(avx2);
    fn();
    if (::testing::Test::HasFatalFailure()) return;
  }
}

}  // namespace quillane
