// The edge bytes of a stretch of a row and then their gray values, so that a stretch's edge
// bytes stay in the first-level cache. The plain variant is written for the compiler to work
// on many bytes per instruction; the AVX2 one takes 32 edge bytes and 32 gray values a step.
// The one this processor runs is chosen per row.
#include "imaging/edge_gray_rows.h"

#include <algorithm>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "imaging/edge_byte.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// Pixels per stretch: their edge bytes take 2 KB.
constexpr int kStretch = 512;

// The edge bytes of the pixels x0 .. x0 + n - 1 of an interior row.
[[gnu::always_inline]] inline void EdgeBytes(const std::uint8_t* __restrict above,
                                             const std::uint8_t* __restrict row,
                                             const std::uint8_t* __restrict below, int x0, int n,
                                             std::uint8_t* __restrict edge) {
  const int first = 4 * x0;
  for (int j = 0; j < 4 * n; ++j) edge[j] = InvertedEdgeByte(above, row, below, first + j);
}

using Grays = void (*)(const std::uint8_t*, const std::uint8_t*, const std::uint8_t*, int, int,
                       std::uint8_t*);

// Gray values of the pixels x0 .. x0 + n - 1 of an interior row into gray[0 .. n - 1].
void PlainGrays(const std::uint8_t* above, const std::uint8_t* row, const std::uint8_t* below,
                int x0, int n, std::uint8_t* gray) {
  alignas(64) Pixel edge[kStretch];
  EdgeBytes(above, row, below, x0, n, reinterpret_cast<std::uint8_t*>(edge));
  GrayLevels(edge, gray, n);
}

#if defined(__x86_64__) && defined(__GNUC__)
// 100 times the gray value's sum of 8 edge pixels: multiply-add of the bytes B, G, R, A with
// 11, 59, 30 and 0.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Sums8(const std::uint8_t* edge) {
  const __m256i e = _mm256_load_si256(reinterpret_cast<const __m256i*>(edge));
  return _mm256_madd_epi16(_mm256_maddubs_epi16(e, _mm256_set1_epi32(0x001E3B0B)),
                           _mm256_set1_epi16(1));
}

// Gray values of 16 sums: (s * 5243) >> 19 is s / 100 up to 25500; exact halves are marked.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Levels16(__m256i s, __m256i& halves) {
  const __m256i fifty = _mm256_set1_epi16(50);
  const __m256i k = _mm256_srli_epi16(_mm256_mulhi_epu16(s, _mm256_set1_epi16(5243)), 3);
  const __m256i rest = _mm256_sub_epi16(s, _mm256_mullo_epi16(k, _mm256_set1_epi16(100)));
  halves = _mm256_cmpeq_epi16(rest, fifty);
  return _mm256_sub_epi16(k, _mm256_cmpgt_epi16(rest, fifty));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Bytes16(const std::uint8_t* p) {
  return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(p)));
}

// The larger kernel response of the 16 bytes from byte i on, as 16-bit numbers.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Response16(const std::uint8_t* above,
                                                                      const std::uint8_t* row,
                                                                      const std::uint8_t* below,
                                                                      int i) {
  const __m256i aboveLeft = Bytes16(above + i - 4), aboveRight = Bytes16(above + i + 4);
  const __m256i belowLeft = Bytes16(below + i - 4), belowRight = Bytes16(below + i + 4);
  const __m256i left =
      _mm256_add_epi16(_mm256_add_epi16(aboveLeft, belowLeft), Bytes16(row + i - 4));
  const __m256i right =
      _mm256_add_epi16(_mm256_add_epi16(aboveRight, belowRight), Bytes16(row + i + 4));
  const __m256i outer = _mm256_add_epi16(_mm256_add_epi16(_mm256_add_epi16(aboveLeft, aboveRight),
                                                          _mm256_add_epi16(belowLeft, belowRight)),
                                         _mm256_add_epi16(Bytes16(above + i), Bytes16(below + i)));
  const __m256i line =
      _mm256_sub_epi16(_mm256_mullo_epi16(Bytes16(row + i), _mm256_set1_epi16(6)), outer);
  return _mm256_max_epi16(line, _mm256_sub_epi16(left, right));
}

// The edge bytes 32 at a time: packing with unsigned saturation is the clamp to 0..255.
[[gnu::target("avx2"), gnu::always_inline]] inline void Avx2EdgeBytes(const std::uint8_t* above,
                                                                      const std::uint8_t* row,
                                                                      const std::uint8_t* below,
                                                                      int x0, int n,
                                                                      std::uint8_t* edge) {
  const int first = 4 * x0, bytes = 4 * n;
  int j = 0;
  for (; j + 32 <= bytes; j += 32) {
    const __m256i packed = _mm256_packus_epi16(Response16(above, row, below, first + j),
                                               Response16(above, row, below, first + j + 16));
    _mm256_store_si256(
        reinterpret_cast<__m256i*>(edge + j),
        _mm256_xor_si256(_mm256_permute4x64_epi64(packed, 0xD8), _mm256_set1_epi8(-1)));
  }
  EdgeBytes(above, row, below, x0 + j / 4, n - j / 4, edge + j);
}

// 32 gray values at a time; exact halves, where only the extended-precision sum decides, come
// out as a bit mask and are looked up.
[[gnu::target("avx2")]] void Avx2Grays(const std::uint8_t* above, const std::uint8_t* row,
                                       const std::uint8_t* below, int x0, int n,
                                       std::uint8_t* gray) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  Avx2EdgeBytes(above, row, below, x0, n, edge);
  // Packing works within halves of the register: the order is restored at the end.
  const __m256i order = _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7);
  int x = 0;
  for (; x + 32 <= n; x += 32) {
    const std::uint8_t* e = edge + 4 * x;
    __m256i h01, h23;
    const __m256i l01 = Levels16(_mm256_packus_epi32(Sums8(e), Sums8(e + 32)), h01);
    const __m256i l23 = Levels16(_mm256_packus_epi32(Sums8(e + 64), Sums8(e + 96)), h23);
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(gray + x),
                        _mm256_permutevar8x32_epi32(_mm256_packus_epi16(l01, l23), order));
    auto halves = static_cast<std::uint32_t>(
        _mm256_movemask_epi8(_mm256_permutevar8x32_epi32(_mm256_packs_epi16(h01, h23), order)));
    for (; halves != 0; halves &= halves - 1) {
      const std::uint8_t* p = e + 4 * __builtin_ctz(halves);
      gray[x + __builtin_ctz(halves)] = GrayValueOfHalf(p[2], p[1], p[0]);
    }
  }
  GrayLevels(reinterpret_cast<const Pixel*>(edge + 4 * x), gray + x, n - x);
}
#endif

}  // namespace

void EdgeGrayRow(const TBitmap32& source, int y, std::uint8_t* gray) {
  const int w = source.Width();
  // The top and bottom rows repeat their inner neighbours, the side pixels theirs.
  const int inner = std::clamp(y, 1, source.Height() - 2);
  const auto* above = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner - 1));
  const auto* row = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner));
  const auto* below = reinterpret_cast<const std::uint8_t*>(source.ScanLine(inner + 1));
  Grays grays = PlainGrays;
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) grays = Avx2Grays;
#endif
  for (int x0 = 1; x0 < w - 1; x0 += kStretch)
    grays(above, row, below, x0, std::min(kStretch, w - 1 - x0), gray + x0);
  gray[0] = gray[1];
  gray[w - 1] = gray[w - 2];
}

}  // namespace quillane
