// Gray rows for the colour filter. The gray value's weighted sum is 30 R + 59 G + 11 B in
// integers; away from an exact half it rounds as the extended-precision sum does, and the exact
// halves (about one pixel in a hundred) are settled from GrayValueOfHalf's table.
#include "imaging/gray_row.h"

#include <algorithm>
#include <bit>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "imaging/gray_half_avx2.h"
#include "imaging/numeric.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

static_assert(std::endian::native == std::endian::little, "pixels are read as 0xAARRGGBB");

constexpr int kStretch = 512;

void PlainGrayRow(const Pixel* in, Pixel* out, int width, std::uint32_t set) {
  std::uint8_t level[kStretch];
  const std::uint32_t raised = set | 0xFF000000u;
  for (int x0 = 0; x0 < width; x0 += kStretch) {
    const int n = std::min(kStretch, width - x0);
    GrayLevels(in + x0, level, n);
    for (int i = 0; i < n; ++i) out[x0 + i] = std::bit_cast<Pixel>(level[i] * 0x010101u | raised);
  }
}

#if defined(__x86_64__) && defined(__GNUC__)
// The weighted sums of 8 pixels as 32-bit numbers: multiply-add of the bytes B, G, R, A with
// 11, 59, 30 and 0.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Sums8(__m256i e) {
  return _mm256_madd_epi16(_mm256_maddubs_epi16(e, _mm256_set1_epi32(0x001E3B0B)),
                           _mm256_set1_epi16(1));
}

// 16 pixels: the sums packed to 16 bits (in-lane, so unpacking restores the order), divided
// by 100 with the remainder deciding the rounding; a group with exact halves in it settles
// them all at once from the table.
[[gnu::target("avx2"), gnu::always_inline]] inline void Gray16(const Pixel* in, Pixel* out,
                                                               __m256i raised,
                                                               const std::uint8_t* table) {
  const __m256i e0 = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in));
  const __m256i e1 = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in + 8));
  const __m256i s = _mm256_packus_epi32(Sums8(e0), Sums8(e1));
  const __m256i fifty = _mm256_set1_epi16(50);
  const __m256i k = _mm256_srli_epi16(_mm256_mulhi_epu16(s, _mm256_set1_epi16(5243)), 3);
  const __m256i rest = _mm256_sub_epi16(s, _mm256_mullo_epi16(k, _mm256_set1_epi16(100)));
  __m256i level = _mm256_sub_epi16(k, _mm256_cmpgt_epi16(rest, fifty));
  const __m256i halves = _mm256_cmpeq_epi16(rest, fifty);
  if (!_mm256_testz_si256(halves, halves))
    level = _mm256_add_epi16(level, _mm256_and_si256(halves, HalfRoundsUp16(e0, e1, table)));
  // The level's low byte into B, G and R of its pixel.
  const __m256i spread = _mm256_setr_epi8(0, 0, 0, -1, 4, 4, 4, -1, 8, 8, 8, -1, 12, 12, 12, -1, 0,
                                          0, 0, -1, 4, 4, 4, -1, 8, 8, 8, -1, 12, 12, 12, -1);
  const __m256i zero = _mm256_setzero_si256();
  const __m256i first = _mm256_unpacklo_epi16(level, zero);
  const __m256i second = _mm256_unpackhi_epi16(level, zero);
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out),
                      _mm256_or_si256(_mm256_shuffle_epi8(first, spread), raised));
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out + 8),
                      _mm256_or_si256(_mm256_shuffle_epi8(second, spread), raised));
}

// Plain stores: on the machines measured, streaming the result past the caches was slower.
[[gnu::target("avx2")]] void Avx2GrayRow(const Pixel* in, Pixel* out, int width,
                                         std::uint32_t set) {
  const __m256i raised = _mm256_set1_epi32(static_cast<int>(set | 0xFF000000u));
  const std::uint8_t* table = GrayHalfRoundsUp();
  int x = 0;
  for (; x + 16 <= width; x += 16) Gray16(in + x, out + x, raised, table);
  if (x < width) PlainGrayRow(in + x, out + x, width - x, set);
}
#endif

}  // namespace

void GrayRowInto(const Pixel* in, Pixel* out, int width, std::uint32_t set) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) {
    Avx2GrayRow(in, out, width, set);
    return;
  }
#endif
  PlainGrayRow(in, out, width, set);
}

}  // namespace quillane
