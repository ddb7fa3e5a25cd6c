// The gray values of the edge map, fused: each row is walked a stretch at a time, and the edge
// bytes of a stretch live only in the first-level cache. The pencil turns the row's gray values
// into pixels through a table; the pen drawings need only whether each is above their
// pressure, which the weighted sums tell without the division. The arithmetic is written so
// that the compiler handles many bytes per instruction; it is compiled twice, for any x86-64
// and for processors with AVX2, and the one this processor runs is chosen at run time.
#include <algorithm>
#include <cstring>
#include <vector>

#include "imaging/edge_byte.h"
#include "imaging/edge_map.h"
#include "imaging/gray_half_avx2.h"
#include "imaging/ink_rows.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"
#include "imaging/vector_intrinsics.h"

namespace quillane {
namespace {

// Pixels per stretch: the stretch's edge bytes, gray values and marks take about 6 KB.
constexpr int kStretch = 1024;

// The edge bytes of the pixels x0 .. x0 + n - 1 of an interior row (1 <= x0,
// x0 + n <= width - 1), as InvertedSobelEdges makes them.
[[gnu::always_inline]] inline void EdgeStretch(const std::uint8_t* __restrict above,
                                               const std::uint8_t* __restrict row,
                                               const std::uint8_t* __restrict below, int x0, int n,
                                               std::uint8_t* __restrict edge) {
  const int first = 4 * x0;
  for (int j = 0; j < 4 * n; ++j) edge[j] = InvertedEdgeByte(above, row, below, first + j);
}

// Gray values of n edge pixels: 100 times the weighted sum is 30 R + 59 G + 11 B exactly, and
// (s * 5243) >> 19 is s / 100 for every s up to 25500. An exact half is marked in half and
// left to GrayValueOfHalf; returns whether there is one.
[[gnu::always_inline]] inline bool GrayStretch(const std::uint8_t* __restrict edge, int n,
                                               std::uint8_t* __restrict level,
                                               std::uint8_t* __restrict half) {
  std::uint8_t anyHalf = 0;
  for (int x = 0; x < n; ++x) {
    const auto sum =
        static_cast<std::uint16_t>(30 * edge[4 * x + 2] + 59 * edge[4 * x + 1] + 11 * edge[4 * x]);
    const auto k = static_cast<std::uint16_t>((static_cast<std::uint32_t>(sum) * 5243u) >> 19);
    const auto rest = static_cast<std::uint16_t>(sum - 100 * k);
    half[x] = rest == 50;
    anyHalf |= half[x];
    level[x] = static_cast<std::uint8_t>(k + (rest > 50));
  }
  return anyHalf != 0;
}

void HalvesOf(const std::uint8_t* edge, std::uint8_t* level, int x) {
  level[x] = GrayValueOfHalf(edge[4 * x + 2], edge[4 * x + 1], edge[4 * x]);
}

// Whether the gray values of n edge pixels are above level, as cells (0xFF above, 0 not): the
// gray value is above level exactly when the sum is above 100 level + 50, but for an exact half
// there, where GrayValueOfHalf decides. A half at the limit is marked in half; returns whether
// there is one. The division and the other halves are not needed.
[[gnu::always_inline]] inline bool CellStretch(const std::uint8_t* __restrict edge, int n,
                                               int level, std::uint8_t* __restrict cells,
                                               std::uint8_t* __restrict half) {
  const int limit = 100 * level + 50;
  std::uint8_t anyHalf = 0;
  for (int x = 0; x < n; ++x) {
    const int sum = 30 * edge[4 * x + 2] + 59 * edge[4 * x + 1] + 11 * edge[4 * x];
    cells[x] = sum > limit ? 0xFF : 0;
    half[x] = sum == limit;
    anyHalf |= half[x];
  }
  return anyHalf != 0;
}

void CellOfHalf(const std::uint8_t* edge, int level, std::uint8_t* cells, int x) {
  cells[x] = GrayValueOfHalf(edge[4 * x + 2], edge[4 * x + 1], edge[4 * x]) > level ? 0xFF : 0;
}

void PlainCells(const std::uint8_t* above, const std::uint8_t* row, const std::uint8_t* below,
                int x0, int n, int level, std::uint8_t* cells) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  std::uint8_t half[kStretch];
  EdgeStretch(above, row, below, x0, n, edge);
  if (CellStretch(edge, n, level, cells, half))
    for (int x = 0; x < n; ++x)
      if (half[x]) CellOfHalf(edge, level, cells, x);
}

void PlainLevels(const std::uint8_t* above, const std::uint8_t* row, const std::uint8_t* below,
                 int x0, int n, int /*level*/, std::uint8_t* level) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  std::uint8_t half[kStretch];
  EdgeStretch(above, row, below, x0, n, edge);
  if (GrayStretch(edge, n, level, half))
    for (int x = 0; x < n; ++x)
      if (half[x]) HalvesOf(edge, level, x);
}

void PlainPixels(const std::uint8_t* level, int n, const std::uint32_t* pixelOf, Pixel* out) {
  for (int x = 0; x < n; ++x)
    std::memcpy(static_cast<void*>(out + x), pixelOf + level[x], sizeof(Pixel));
}

#if defined(__x86_64__) && defined(__GNUC__)
// The weighted sums of 8 pixels: multiply-add of the bytes with 11, 59, 30 and 0.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Sums8(__m256i e) {
  return _mm256_madd_epi16(_mm256_maddubs_epi16(e, _mm256_set1_epi32(0x001E3B0B)),
                           _mm256_set1_epi16(1));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Load32(const std::uint8_t* p) {
  return _mm256_load_si256(reinterpret_cast<const __m256i*>(p));
}

// Gray values of 16 sums, with the exact halves marked in halves.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Levels16(__m256i s, __m256i& halves) {
  const __m256i fifty = _mm256_set1_epi16(50);
  const __m256i k = _mm256_srli_epi16(_mm256_mulhi_epu16(s, _mm256_set1_epi16(5243)), 3);
  const __m256i rest = _mm256_sub_epi16(s, _mm256_mullo_epi16(k, _mm256_set1_epi16(100)));
  halves = _mm256_cmpeq_epi16(rest, fifty);
  return _mm256_sub_epi16(k, _mm256_cmpgt_epi16(rest, fifty));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Widened16(const std::uint8_t* p) {
  return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(p)));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m128i Widened8(const std::uint8_t* p) {
  return _mm_cvtepu8_epi16(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(p)));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i At16(const std::int16_t* p) {
  return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
}

// max(line, gradient) of 16 bytes from the column sums: vertical[k] is above + below and
// column[k] above + row + below at byte k - 4 of the stretch, so the line is 6 row less the
// three vertical sums around, and the gradient the column to the left less the one to the right.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i ResponseOfSums16(
    const std::int16_t* vertical, const std::int16_t* column, const std::uint8_t* row, int j) {
  const __m256i outer = _mm256_add_epi16(
      _mm256_add_epi16(At16(vertical + j), At16(vertical + j + 4)), At16(vertical + j + 8));
  const __m256i line =
      _mm256_sub_epi16(_mm256_mullo_epi16(Widened16(row + j), _mm256_set1_epi16(6)), outer);
  return _mm256_max_epi16(line, _mm256_sub_epi16(At16(column + j), At16(column + j + 8)));
}

// The edge bytes 32 at a time: packing with unsigned saturation is the clamp to 0..255. The
// sums of each column of three are made once, where each of them serves four responses.
[[gnu::target("avx2"), gnu::always_inline]] inline void Avx2EdgeStretch(const std::uint8_t* above,
                                                                        const std::uint8_t* row,
                                                                        const std::uint8_t* below,
                                                                        int x0, int n,
                                                                        std::uint8_t* edge) {
  const int first = 4 * x0;
  const int bytes = 4 * n;
  // The sums a block of responses needs, for its bytes and four on either side; blocks are
  // short so that the sums stay in the first-level cache beside the rows and the edge bytes.
  constexpr int kBlock = 256;
  alignas(32) std::int16_t vertical[kBlock + 8], column[kBlock + 8];
  int j = 0;
  while (j + 32 <= bytes) {
    const int m = std::min(kBlock, (bytes - j) / 32 * 32);
    const int i0 = first + j - 4;
    int k = 0;
    for (; k < m; k += 16) {
      const __m256i v = _mm256_add_epi16(Widened16(above + i0 + k), Widened16(below + i0 + k));
      _mm256_store_si256(reinterpret_cast<__m256i*>(vertical + k), v);
      _mm256_store_si256(reinterpret_cast<__m256i*>(column + k),
                         _mm256_add_epi16(v, Widened16(row + i0 + k)));
    }
    // The last eight, read eight bytes wide: sixteen would pass the row's end.
    const __m128i v = _mm_add_epi16(Widened8(above + i0 + k), Widened8(below + i0 + k));
    _mm_store_si128(reinterpret_cast<__m128i*>(vertical + k), v);
    _mm_store_si128(reinterpret_cast<__m128i*>(column + k),
                    _mm_add_epi16(v, Widened8(row + i0 + k)));
    for (int r = 0; r < m; r += 32) {
      const __m256i packed =
          _mm256_packus_epi16(ResponseOfSums16(vertical, column, row + first + j, r),
                              ResponseOfSums16(vertical, column, row + first + j, r + 16));
      const __m256i ordered = _mm256_permute4x64_epi64(packed, 0xD8);
      _mm256_store_si256(reinterpret_cast<__m256i*>(edge + j + r),
                         _mm256_xor_si256(ordered, _mm256_set1_epi8(-1)));
    }
    j += m;
  }
  if (j < bytes) EdgeStretch(above + j, row + j, below + j, x0, (bytes - j) / 4, edge + j);
}

// The gray values of 32 pixels from their edge bytes e. A group with exact halves in it settles
// them all at once from the table, whose gathers cost less than a call and a mispredicted
// branch per half.
[[gnu::target("avx2"), gnu::always_inline]] inline void Avx2Levels32(const std::uint8_t* e,
                                                                     const std::uint8_t* table,
                                                                     std::uint8_t* level) {
  const __m256i e0 = Load32(e), e1 = Load32(e + 32), e2 = Load32(e + 64), e3 = Load32(e + 96);
  // Packing works within halves of the register: the order is restored at the end.
  const __m256i s01 = _mm256_packus_epi32(Sums8(e0), Sums8(e1));
  const __m256i s23 = _mm256_packus_epi32(Sums8(e2), Sums8(e3));
  __m256i h01, h23;
  __m256i l01 = Levels16(s01, h01);
  __m256i l23 = Levels16(s23, h23);
  if (!_mm256_testz_si256(h01, h01) || !_mm256_testz_si256(h23, h23)) {
    l01 = _mm256_add_epi16(l01, _mm256_and_si256(h01, HalfRoundsUp16(e0, e1, table)));
    l23 = _mm256_add_epi16(l23, _mm256_and_si256(h23, HalfRoundsUp16(e2, e3, table)));
  }
  const __m256i bytes = _mm256_permutevar8x32_epi32(_mm256_packus_epi16(l01, l23),
                                                    _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(level), bytes);
}

// The gray values of the pixels from x on, the plain way.
inline void LevelsFrom(const std::uint8_t* edge, int x, int n, std::uint8_t* level,
                       std::uint8_t* half) {
  if (x < n && GrayStretch(edge + 4 * x, n - x, level + x, half))
    for (int i = x; i < n; ++i)
      if (half[i - x]) HalvesOf(edge, level, i);
}

[[gnu::target("avx2")]] void Avx2Levels(const std::uint8_t* above, const std::uint8_t* row,
                                        const std::uint8_t* below, int x0, int n, int /*level*/,
                                        std::uint8_t* level) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  std::uint8_t half[kStretch];
  Avx2EdgeStretch(above, row, below, x0, n, edge);
  const std::uint8_t* table = GrayHalfRoundsUp();
  int x = 0;
  for (; x + 32 <= n; x += 32) Avx2Levels32(edge + 4 * x, table, level + x);
  LevelsFrom(edge, x, n, level, half);
}

// The same with twice as many lanes, for processors with AVX-512 (F, BW, VL and DQ).

QUILLANE_AVX512_INLINE __m512i Widened32(const std::uint8_t* p) {
  return _mm512_cvtepu8_epi16(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(p)));
}

QUILLANE_AVX512_INLINE __m512i At32(const std::int16_t* p) {
  return _mm512_loadu_si512(p);
}

// ResponseOfSums16 for 32 bytes, with the row's own part of the line kept beside the sums:
// own[k] is 6 row less vertical[k], so the line is own less the vertical sums on either side.
QUILLANE_AVX512_INLINE __m512i ResponseOfSums32(const std::int16_t* vertical,
                                                const std::int16_t* column, const std::int16_t* own,
                                                int j) {
  const __m512i line = _mm512_sub_epi16(_mm512_sub_epi16(At32(own + j + 4), At32(vertical + j)),
                                        At32(vertical + j + 8));
  return _mm512_max_epi16(line, _mm512_sub_epi16(At32(column + j), At32(column + j + 8)));
}

// Avx2EdgeStretch 64 bytes at a time; the bytes after the last 64 go the AVX2 way. Each row
// byte is widened once, where the sums are made.
QUILLANE_AVX512_INLINE void Avx512EdgeStretch(const std::uint8_t* above, const std::uint8_t* row,
                                              const std::uint8_t* below, int x0, int n,
                                              std::uint8_t* edge) {
  const int first = 4 * x0;
  const int bytes = 4 * n;
  constexpr int kBlock = 256;
  alignas(64) std::int16_t vertical[kBlock + 8], column[kBlock + 8], own[kBlock + 8];
  const __m512i six = _mm512_set1_epi16(6);
  int j = 0;
  while (j + 64 <= bytes) {
    const int m = std::min(kBlock, (bytes - j) / 64 * 64);
    const int i0 = first + j - 4;
    int k = 0;
    for (; k < m; k += 32) {
      const __m512i v = _mm512_add_epi16(Widened32(above + i0 + k), Widened32(below + i0 + k));
      const __m512i centre = Widened32(row + i0 + k);
      _mm512_store_si512(vertical + k, v);
      _mm512_store_si512(column + k, _mm512_add_epi16(v, centre));
      _mm512_store_si512(own + k, _mm512_sub_epi16(_mm512_mullo_epi16(centre, six), v));
    }
    // The last eight, read eight bytes wide: more would pass the row's end.
    const __m128i v = _mm_add_epi16(Widened8(above + i0 + k), Widened8(below + i0 + k));
    const __m128i centre = Widened8(row + i0 + k);
    _mm_store_si128(reinterpret_cast<__m128i*>(vertical + k), v);
    _mm_store_si128(reinterpret_cast<__m128i*>(column + k), _mm_add_epi16(v, centre));
    _mm_store_si128(reinterpret_cast<__m128i*>(own + k),
                    _mm_sub_epi16(_mm_mullo_epi16(centre, _mm_set1_epi16(6)), v));
    for (int r = 0; r < m; r += 64) {
      const __m512i packed = _mm512_packus_epi16(ResponseOfSums32(vertical, column, own, r),
                                                 ResponseOfSums32(vertical, column, own, r + 32));
      const __m512i ordered =
          _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7), packed);
      _mm512_store_si512(edge + j + r, _mm512_xor_si512(ordered, _mm512_set1_epi8(-1)));
    }
    j += m;
  }
  if (j < bytes) Avx2EdgeStretch(above, row, below, x0 + j / 4, n - j / 4, edge + j);
}

QUILLANE_AVX512_INLINE __m512i Sums16(__m512i e) {
  return _mm512_madd_epi16(_mm512_maddubs_epi16(e, _mm512_set1_epi32(0x001E3B0B)),
                           _mm512_set1_epi16(1));
}

// Levels16 for 32 sums, the halves marked in a mask.
QUILLANE_AVX512_INLINE __m512i Levels32(__m512i s, __mmask32& halves) {
  const __m512i fifty = _mm512_set1_epi16(50);
  const __m512i k = _mm512_srli_epi16(_mm512_mulhi_epu16(s, _mm512_set1_epi16(5243)), 3);
  const __m512i rest = _mm512_sub_epi16(s, _mm512_mullo_epi16(k, _mm512_set1_epi16(100)));
  halves = _mm512_cmpeq_epi16_mask(rest, fifty);
  return _mm512_mask_add_epi16(k, _mm512_cmpgt_epi16_mask(rest, fifty), k, _mm512_set1_epi16(1));
}

// HalfRoundsUp8 for 16 pixels.
QUILLANE_AVX512_INLINE __m512i HalfRoundsUp16x(__m512i v, const std::uint8_t* table) {
  const __m512i redGreen =
      _mm512_shuffle_epi8(v, _mm512_broadcast_i32x4(_mm_setr_epi8(1, 2, -1, -1, 5, 6, -1, -1, 9, 10,
                                                                  -1, -1, 13, 14, -1, -1)));
  const __m512i bits = _mm512_i32gather_epi32(redGreen, table, 1);
  const __m512i blue = _mm512_and_si512(v, _mm512_set1_epi32(0xFF));
  const __m512i one = _mm512_set1_epi32(1);
  __m512i hundreds =
      _mm512_maskz_mov_epi32(_mm512_cmpgt_epi32_mask(blue, _mm512_set1_epi32(99)), one);
  hundreds = _mm512_mask_add_epi32(hundreds, _mm512_cmpgt_epi32_mask(blue, _mm512_set1_epi32(199)),
                                   hundreds, one);
  return _mm512_and_si512(_mm512_srlv_epi32(bits, hundreds), one);
}

// The gray values of 64 pixels from their edge bytes e, as Avx2Levels32.
QUILLANE_AVX512_INLINE void Avx512Levels64(const std::uint8_t* e, const std::uint8_t* table,
                                           std::uint8_t* level) {
  const __m512i e0 = _mm512_load_si512(e), e1 = _mm512_load_si512(e + 64);
  const __m512i e2 = _mm512_load_si512(e + 128), e3 = _mm512_load_si512(e + 192);
  // Packing works within quarters of the register: the order is restored at the end.
  const __m512i s01 = _mm512_packus_epi32(Sums16(e0), Sums16(e1));
  const __m512i s23 = _mm512_packus_epi32(Sums16(e2), Sums16(e3));
  __mmask32 h01, h23;
  __m512i l01 = Levels32(s01, h01);
  __m512i l23 = Levels32(s23, h23);
  // Each half of the group looks its halves up only when it has some.
  if (h01 != 0)
    l01 = _mm512_mask_add_epi16(
        l01, h01, l01, _mm512_packus_epi32(HalfRoundsUp16x(e0, table), HalfRoundsUp16x(e1, table)));
  if (h23 != 0)
    l23 = _mm512_mask_add_epi16(
        l23, h23, l23, _mm512_packus_epi32(HalfRoundsUp16x(e2, table), HalfRoundsUp16x(e3, table)));
  const __m512i order = _mm512_setr_epi32(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15);
  _mm512_storeu_si512(level, _mm512_permutexvar_epi32(order, _mm512_packus_epi16(l01, l23)));
}

QUILLANE_AVX512 void Avx512Levels(const std::uint8_t* above, const std::uint8_t* row,
                                  const std::uint8_t* below, int x0, int n, int /*level*/,
                                  std::uint8_t* level) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  std::uint8_t half[kStretch];
  Avx512EdgeStretch(above, row, below, x0, n, edge);
  const std::uint8_t* table = GrayHalfRoundsUp();
  int x = 0;
  for (; x + 64 <= n; x += 64) Avx512Levels64(edge + 4 * x, table, level + x);
  for (; x + 32 <= n; x += 32) Avx2Levels32(edge + 4 * x, table, level + x);
  LevelsFrom(edge, x, n, level, half);
}

// The cells 32 pixels at a time, by comparing the sums. A sum exactly at the limit is a half
// whose gray value is the level, or above it when the half rounds up.
[[gnu::target("avx2")]] void Avx2Cells(const std::uint8_t* above, const std::uint8_t* row,
                                       const std::uint8_t* below, int x0, int n, int level,
                                       std::uint8_t* cells) {
  alignas(64) std::uint8_t edge[4 * kStretch];
  std::uint8_t half[kStretch];
  Avx2EdgeStretch(above, row, below, x0, n, edge);
  const std::uint8_t* table = GrayHalfRoundsUp();
  const __m256i order = _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7);
  const __m256i limit = _mm256_set1_epi16(static_cast<std::int16_t>(100 * level + 50));
  const __m256i zero = _mm256_setzero_si256();
  int x = 0;
  for (; x + 32 <= n; x += 32) {
    const std::uint8_t* e = edge + 4 * x;
    const __m256i e0 = Load32(e), e1 = Load32(e + 32), e2 = Load32(e + 64), e3 = Load32(e + 96);
    // Packing works within halves of the register: the order is restored at the end.
    const __m256i s01 = _mm256_packus_epi32(Sums8(e0), Sums8(e1));
    const __m256i s23 = _mm256_packus_epi32(Sums8(e2), Sums8(e3));
    __m256i above01 = _mm256_cmpgt_epi16(s01, limit);
    __m256i above23 = _mm256_cmpgt_epi16(s23, limit);
    const __m256i at01 = _mm256_cmpeq_epi16(s01, limit);
    const __m256i at23 = _mm256_cmpeq_epi16(s23, limit);
    if (!_mm256_testz_si256(at01, at01) || !_mm256_testz_si256(at23, at23)) {
      const __m256i up01 = _mm256_sub_epi16(zero, HalfRoundsUp16(e0, e1, table));
      const __m256i up23 = _mm256_sub_epi16(zero, HalfRoundsUp16(e2, e3, table));
      above01 = _mm256_or_si256(above01, _mm256_and_si256(at01, up01));
      above23 = _mm256_or_si256(above23, _mm256_and_si256(at23, up23));
    }
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(cells + x),
                        _mm256_permutevar8x32_epi32(_mm256_packs_epi16(above01, above23), order));
  }
  if (x < n && CellStretch(edge + 4 * x, n - x, level, cells + x, half))
    for (int i = x; i < n; ++i)
      if (half[i - x]) CellOfHalf(edge, level, cells, i);
}

// The table's pixels go past the caches: the result is far larger than they are, and streaming
// stores spare reading each line of it before writing it. The band ends with a store fence.
[[gnu::target("avx2")]] void Avx2Pixels(const std::uint8_t* level, int n,
                                        const std::uint32_t* pixelOf, Pixel* out) {
  alignas(32) std::uint32_t pixels[kStretch];
  for (int x0 = 0; x0 < n; x0 += kStretch) {
    const int m = std::min(kStretch, n - x0);
    for (int x = 0; x < m; ++x) pixels[x] = pixelOf[level[x0 + x]];
    auto* dst = reinterpret_cast<std::uint8_t*>(out + x0);
    int i = 0;
    for (; i < m && reinterpret_cast<std::uintptr_t>(dst + 4 * i) % 32 != 0; ++i)
      std::memcpy(dst + 4 * i, pixels + i, 4);
    for (; i + 8 <= m; i += 8)
      _mm256_stream_si256(reinterpret_cast<__m256i*>(dst + 4 * i),
                          _mm256_loadu_si256(reinterpret_cast<const __m256i*>(pixels + i)));
    for (; i < m; ++i) std::memcpy(dst + 4 * i, pixels + i, 4);
  }
}
#endif

// A stretch of an interior row's gray values, or of its cells at a level.
using LevelStretch = void (*)(const std::uint8_t*, const std::uint8_t*, const std::uint8_t*, int,
                              int, int, std::uint8_t*);
using PixelRow = void (*)(const std::uint8_t*, int, const std::uint32_t*, Pixel*);

LevelStretch ChooseLevels() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx512()) return Avx512Levels;
  if (UseAvx2()) return Avx2Levels;
#endif
  return PlainLevels;
}

LevelStretch ChooseCells() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2Cells;
#endif
  return PlainCells;
}

PixelRow ChoosePixels() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2Pixels;
#endif
  return PlainPixels;
}

// Gray values (or cells) of edge row y from source rows y - 1, y and y + 1, a stretch at a
// time; the border rows and columns repeat their inner neighbours, and so do their gray values.
void EdgeRowLevels(LevelStretch stretch, const Bitmap32& source, int y, int level,
                   std::uint8_t* out) {
  const int w = source.Width();
  y = std::clamp(y, 1, source.Height() - 2);
  const auto* above = reinterpret_cast<const std::uint8_t*>(source.ScanLine(y - 1));
  const auto* row = reinterpret_cast<const std::uint8_t*>(source.ScanLine(y));
  const auto* below = reinterpret_cast<const std::uint8_t*>(source.ScanLine(y + 1));
  for (int x0 = 1; x0 < w - 1; x0 += kStretch)
    stretch(above, row, below, x0, std::min(kStretch, w - 1 - x0), level, out + x0);
  out[0] = out[1];
  out[w - 1] = out[w - 2];
}

}  // namespace

void GrayEdgeCells(const Bitmap32& source, int y, int level, std::uint8_t* cells) {
  // Gray values are bytes: none is above 255, all are above -1.
  EdgeRowLevels(ChooseCells(), source, y, std::clamp(level, -1, 255), cells);
}

void GrayEdgeRow(const Bitmap32& source, int y, std::uint8_t* gray) {
  EdgeRowLevels(ChooseLevels(), source, y, 0, gray);
}

Bitmap32 GrayEdgeLevels(const Bitmap32& source, const std::array<std::uint8_t, 256>& levels) {
  const int w = source.Width();
  const int h = source.Height();
  if (w < 3 || h < 3) {
    // No interior pixel: the border rules alone, the plain way.
    Bitmap32 edges = source;
    InvertedSobelEdges(edges);
    for (int y = 0; y < h; ++y) {
      Pixel* p = edges.ScanLine(y);
      for (int x = 0; x < w; ++x) {
        const std::uint8_t v = levels[GrayValue(p[x].r, p[x].g, p[x].b)];
        p[x] = Pixel{v, v, v, 255};
      }
    }
    return edges;
  }
  const LevelStretch stretch = ChooseLevels();
  const PixelRow pixels = ChoosePixels();
  std::uint32_t pixelOf[256];
  for (int v = 0; v < 256; ++v)
    pixelOf[v] = 0xFF000000u | 0x010101u * levels[static_cast<std::size_t>(v)];

  Bitmap32 out = Bitmap32::ForOverwrite(w, h);
  ParallelRowRuns(0, h, static_cast<std::size_t>(w) * 12, [&](int y0, int y1) {
    std::vector<std::uint8_t> level(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      EdgeRowLevels(stretch, source, y, 0, level.data());
      pixels(level.data(), w, pixelOf, out.ScanLine(y));
    }
    EndStreamedRows();
  });
  return out;
}

}  // namespace quillane
