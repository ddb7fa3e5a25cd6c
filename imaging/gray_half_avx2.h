// The exact halves of the gray value's weighted sum settled eight pixels at a time, for the
// AVX2 variants: one gather from the table GrayValueOfHalf reads instead of a call per pixel.
#pragma once

#if defined(__x86_64__) && defined(__GNUC__)
#include <cstdint>

#include "imaging/vector_intrinsics.h"

namespace quillane {

// Whether an exact half of each of eight pixels (0xAARRGGBB words in v) rounds up, 0 or 1 in
// 32-bit lanes; table is GrayHalfRoundsUp(). Lanes whose sum is no exact half get a meaningless
// bit, which the caller masks off.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i HalfRoundsUp8(
    __m256i v, const std::uint8_t* table) {
  const __m256i redGreen = _mm256_shuffle_epi8(
      v, _mm256_setr_epi8(1, 2, -1, -1, 5, 6, -1, -1, 9, 10, -1, -1, 13, 14, -1, -1, 1, 2, -1, -1,
                          5, 6, -1, -1, 9, 10, -1, -1, 13, 14, -1, -1));
  const __m256i bits = _mm256_i32gather_epi32(reinterpret_cast<const int*>(table), redGreen, 1);
  const __m256i blue = _mm256_and_si256(v, _mm256_set1_epi32(0xFF));
  const __m256i hundreds = _mm256_sub_epi32(
      _mm256_sub_epi32(_mm256_setzero_si256(), _mm256_cmpgt_epi32(blue, _mm256_set1_epi32(99))),
      _mm256_cmpgt_epi32(blue, _mm256_set1_epi32(199)));
  return _mm256_and_si256(_mm256_srlv_epi32(bits, hundreds), _mm256_set1_epi32(1));
}

// The same for sixteen pixels whose sums were packed to 16 bits from v0 then v1
// (_mm256_packus_epi32), in the packed order.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i HalfRoundsUp16(
    __m256i v0, __m256i v1, const std::uint8_t* table) {
  return _mm256_packus_epi32(HalfRoundsUp8(v0, table), HalfRoundsUp8(v1, table));
}

}  // namespace quillane
#endif
