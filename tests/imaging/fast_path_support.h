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

// Single rows and columns, widths either side of the 8-, 16- and 32-pixel vectors and of the
// 1024-pixel chunks and stretches, heights below the number of bands, and tall pictures for the
// half- and third-size copies.
inline constexpr std::pair<int, int> kAwkwardSizes[] = {
    {1, 1},    {1, 9},    {9, 1},    {2, 2},    {2, 5},    {5, 2},  {3, 3},    {4, 3},
    {3, 9},    {9, 4},    {10, 3},   {17, 2},   {18, 5},   {19, 3}, {33, 4},   {35, 3},
    {33, 31},  {40, 6},   {45, 8},   {66, 7},   {71, 12},  {3, 70}, {101, 13}, {259, 4},
    {300, 11}, {1026, 3}, {1027, 4}, {1060, 6}, {100, 100}};

// Soft gradients with a little grain: edge maps with the mid-range values (and the exact halves
// of the gray value) that noise, whose edge map is all 0 and 255, lacks, and the colours near
// gray where hue and saturation meet exact halves most.
inline Bitmap32 SoftPicture(int w, int h, unsigned seed) {
  std::mt19937 rng(seed);
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const auto channel = [&](int slope) {
        return static_cast<std::uint8_t>(ClampByte(90 + slope * (x + 2 * y) % 110 + rng() % 9));
      };
      b.At(x, y) = Pixel{channel(1), channel(2), channel(3), static_cast<std::uint8_t>(rng())};
    }
  return b;
}

// Sets the widest vectors allowed (and optionally the row split) while it lives, then restores
// both.
class FastPathVariant {
 public:
  explicit FastPathVariant(VectorWidth widest, RowSplit split = {}) {
    SetRowSplit(split);
    SetWidestVectors(widest);
  }
  ~FastPathVariant() {
    SetRowSplit({});
    SetWidestVectors(VectorWidth::Avx512);
    SetGathersAllowed(true);
  }
};

inline const char* WidthName(VectorWidth width) {
  return width == VectorWidth::Avx512 ? "AVX-512" : (width == VectorWidth::Avx2 ? "AVX2" : "plain");
}

// Runs fn in one band with the widest vectors, in many bands with AVX2 at most and in many
// bands with the plain variants, stopping at the first fatal failure; the failure messages say
// which.
template <typename Fn>
void ForEachSplit(Fn&& fn) {
  const std::pair<RowSplit, VectorWidth> variants[] = {
      {{1, kParallelThreshold}, VectorWidth::Avx512},
      {{5, 0}, VectorWidth::Avx2},
      {{3, 0}, VectorWidth::Plain}};
  for (const auto& [split, widest] : variants) {
    SCOPED_TRACE(::testing::Message() << "bands " << split.threads << ", " << WidthName(widest));
    const FastPathVariant variant(widest, split);
    fn();
    if (::testing::Test::HasFatalFailure()) return;
  }
}

// Runs fn with each width of vectors allowed at most.
template <typename Fn>
void ForEachVectorWidth(Fn&& fn) {
  for (const VectorWidth widest : {VectorWidth::Avx512, VectorWidth::Avx2, VectorWidth::Plain}) {
    SCOPED_TRACE(WidthName(widest));
    const FastPathVariant variant(widest);
    fn();
    if (::testing::Test::HasFatalFailure()) return;
  }
}

}  // namespace quillane
