// Emboss in one pass over bands of rows, each output row written once. The relief bytes and
// their gray value are worked out in bytes and 16-bit numbers, many at once; the variant for
// processors with AVX2 is chosen once per run of the effect.
#include "effects/surface/emboss.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "effects/registry.h"
#include "imaging/gray_half_avx2.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// n relief pixels from the pixels p and their neighbours q.
void PlainReliefRow(const Pixel* p, const Pixel* q, int n, int lift, Pixel* out) {
  // Byte by byte, alpha included: the gray step overwrites alpha anyway, and a plain byte loop
  // is one the compiler can widen. Locals, so that the byte stores cannot be taken to change
  // them.
  const auto* pb = reinterpret_cast<const std::uint8_t*>(p);
  const auto* qb = reinterpret_cast<const std::uint8_t*>(q);
  auto* v = reinterpret_cast<std::uint8_t*>(out);
  const int bytes = 4 * n;
  for (int i = 0; i < bytes; ++i) {
    const int d = pb[i] - qb[i] + lift;
    const int a = d < 0 ? -d : d;
    v[i] = static_cast<std::uint8_t>(a > 255 ? 255 : a);
  }
  ConvertRowToGray(out, n);
}

#if defined(__x86_64__) && defined(__GNUC__)
// The relief bytes of eight pixels. In saturating byte arithmetic, with lift 0..255, exactly
// one of (p -sat q +sat lift) -sat (q -sat p) and (q -sat p) -sat lift can be above 0, and it
// is min(255, |p - q + lift|).
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Relief8(const std::uint8_t* p,
                                                                   const std::uint8_t* q,
                                                                   __m256i lift) {
  const __m256i pv = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
  const __m256i qv = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(q));
  const __m256i pq = _mm256_subs_epu8(pv, qv);
  const __m256i qp = _mm256_subs_epu8(qv, pv);
  return _mm256_or_si256(_mm256_subs_epu8(_mm256_adds_epu8(pq, lift), qp),
                         _mm256_subs_epu8(qp, lift));
}

// 100 times the weighted sums of eight pixels, 30 R + 59 G + 11 B, in 32-bit lanes.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Sums8(__m256i v) {
  return _mm256_madd_epi16(_mm256_maddubs_epi16(v, _mm256_set1_epi32(0x001E3B0B)),
                           _mm256_set1_epi16(1));
}

// Sixteen gray pixels into gray0 (pixels 0-7) and gray1 (8-15). With s the sum, the level is
// (s + 49) / 100 but for an exact half (s = 100 k + 50), where (s + 50) / 100 is larger and the
// table decides; (t * 5243) >> 19 is t / 100 for every t up to 43000.
[[gnu::target("avx2"), gnu::always_inline]] inline void Gray16(const std::uint8_t* p,
                                                               const std::uint8_t* q, __m256i lift,
                                                               const std::uint8_t* table,
                                                               __m256i& gray0, __m256i& gray1) {
  const __m256i v0 = Relief8(p, q, lift);
  const __m256i v1 = Relief8(p + 32, q + 32, lift);
  // Packing works within halves of the register: lane 0 holds pixels 0-3 and 8-11, lane 1
  // pixels 4-7 and 12-15.
  const __m256i s = _mm256_packus_epi32(Sums8(v0), Sums8(v1));
  const __m256i scale = _mm256_set1_epi16(5243);
  const __m256i t = _mm256_add_epi16(s, _mm256_set1_epi16(49));
  __m256i level = _mm256_srli_epi16(_mm256_mulhi_epu16(t, scale), 3);
  const __m256i above =
      _mm256_srli_epi16(_mm256_mulhi_epu16(_mm256_add_epi16(t, _mm256_set1_epi16(1)), scale), 3);
  const __m256i whole = _mm256_cmpeq_epi16(level, above);
  // Exact halves are rare enough that most groups have none.
  if (_mm256_movemask_epi8(whole) != -1)
    level = _mm256_add_epi16(level, _mm256_andnot_si256(whole, HalfRoundsUp16(v0, v1, table)));
  const __m256i alpha = _mm256_set1_epi32(static_cast<std::int32_t>(0xFF000000u));
  const __m256i first = _mm256_setr_epi8(0, 0, 0, -1, 2, 2, 2, -1, 4, 4, 4, -1, 6, 6, 6, -1, 0, 0,
                                         0, -1, 2, 2, 2, -1, 4, 4, 4, -1, 6, 6, 6, -1);
  const __m256i second =
      _mm256_setr_epi8(8, 8, 8, -1, 10, 10, 10, -1, 12, 12, 12, -1, 14, 14, 14, -1, 8, 8, 8, -1, 10,
                       10, 10, -1, 12, 12, 12, -1, 14, 14, 14, -1);
  gray0 = _mm256_or_si256(_mm256_shuffle_epi8(level, first), alpha);
  gray1 = _mm256_or_si256(_mm256_shuffle_epi8(level, second), alpha);
}

[[gnu::target("avx2"), gnu::always_inline]] inline void Store16(std::uint8_t* out, __m256i gray0,
                                                                __m256i gray1) {
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out), gray0);
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out + 32), gray1);
}

// n >= 16 pixels in groups of sixteen, the first and the last overlapping their neighbours.
// In between the result streams past the caches: it is far larger than they are, and streaming
// spares reading each line of it before writing it. The band ends with a store fence.
[[gnu::target("avx2")]] void Avx2ReliefRow(const Pixel* p, const Pixel* q, int n, int lift,
                                           Pixel* out) {
  const auto address = reinterpret_cast<std::uintptr_t>(out);
  if (n < 16 || address % 4 != 0) {
    PlainReliefRow(p, q, n, lift, out);
    return;
  }
  const auto* pb = reinterpret_cast<const std::uint8_t*>(p);
  const auto* qb = reinterpret_cast<const std::uint8_t*>(q);
  auto* dst = reinterpret_cast<std::uint8_t*>(out);
  const std::uint8_t* table = GrayHalfRoundsUp();
  const __m256i l = _mm256_set1_epi8(static_cast<char>(lift));
  const int end = 4 * n;
  __m256i gray0, gray1;
  Gray16(pb, qb, l, table, gray0, gray1);
  Store16(dst, gray0, gray1);
  int j = static_cast<int>((32 - address % 32) % 32);
  for (; j + 64 <= end; j += 64) {
    Gray16(pb + j, qb + j, l, table, gray0, gray1);
    _mm256_stream_si256(reinterpret_cast<__m256i*>(dst + j), gray0);
    _mm256_stream_si256(reinterpret_cast<__m256i*>(dst + j + 32), gray1);
  }
  if (j < end) {
    Gray16(pb + end - 64, qb + end - 64, l, table, gray0, gray1);
    Store16(dst + end - 64, gray0, gray1);
  }
}
#endif

using ReliefRow = void (*)(const Pixel*, const Pixel*, int, int, Pixel*);

// The byte arithmetic wants lift as a byte; other lightings than the window's take the plain
// variant.
ReliefRow ChooseReliefRow(int lift) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2() && lift >= 0 && lift <= 255) return Avx2ReliefRow;
#endif
  (void)lift;
  return PlainReliefRow;
}

}  // namespace

Bitmap32 emboss(const Bitmap32& source, int lighting, int depth) {
  const int width = source.Width();
  const int height = source.Height();
  const int w = width - depth;
  const int h = height - depth;
  if (depth < 1 || w <= 0 || h <= 0) return source;
  const ReliefRow relief = ChooseReliefRow(lighting + 50);
  Bitmap32 out = ScratchPicture(width, height);
  // Every Q is read from the untouched source, so rows can be done in any order; the result is
  // the one a top-to-bottom pass in place gives. Unvisited pixels keep the source's.
  ParallelRowRuns(0, height, static_cast<std::size_t>(width) * 2, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const Pixel* p = source.ScanLine(y);
      Pixel* row = out.ScanLine(y);
      const int from = y < h ? w : 0;
      if (y < h) relief(p, source.ScanLine(y + depth) + depth, w, lighting + 50, row);
      std::memcpy(static_cast<void*>(row + from), p + from,
                  static_cast<std::size_t>(width - from) * sizeof(Pixel));
    }
#if defined(__x86_64__)
    _mm_sfence();
#endif
  });
  return out;
}

const EffectSpec& EmbossEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Veins,
      .menuPosition = 1,
      .menuEntry = "Emboss",
      .menuObjectName = "Emboss1",
      .windowObjectName = "TEmboss",
      .caption = "Emboss",
      .statusText = "Emboss",
      .cliName = "emboss",
      .batchTag = "Emboss",
      .collapsedHeight = 103,
      .expandedHeight = 184,
      .batchPushesHistory = true,
      .apply = {"Button2", "OK", ""},
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              {.name = "lighting",
               .objectName = "TrackBar1",
               .caption = "Lighting:",
               .maximum = 200,
               .defaultValue = 100,
               .pageStep = 10,
               .numberLabel = "Label9",
               .initialNumber = "100",
               .help = "offset added to each difference; flat areas become gray 50 + lighting"},
              {.name = "depth",
               .objectName = "TrackBar2",
               .caption = "Depth:",
               .minimum = 1,
               .maximum = 5,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "distance to the neighbour compared, down and to the right"},
          },
      .reference = {.hash = 0x9b93a73ce25c71c1,
                    .topLeft = 0x959595,
                    .centre = 0x9e9e9e,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            return emboss(in.source, in.params.GetInt("lighting"), in.params.GetInt("depth"));
          },
  };
  return entry;
}

}  // namespace quillane
