#include "effects/paint/water_color.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <utility>
#include <vector>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

using Byte = std::uint8_t;

// Every row routine below writes n bytes (whole pixels) at dst from the bytes at the same
// places of above, row and below and from their neighbours one pixel to either side, which must
// be readable. The alpha bytes it writes are row's. dst overlaps none of the inputs.
using RowKernel = void (*)(const Byte*, const Byte*, const Byte*, Byte*, int);

// Bytes of a row handled per round, so the column sorts stay in the first-level cache.
constexpr int kChunk = 1024;

// By value, so that the compiler turns them into byte-wide min and max instructions.
inline Byte Min(Byte a, Byte b) {
  return a < b ? a : b;
}
inline Byte Max(Byte a, Byte b) {
  return a < b ? b : a;
}
inline Byte Median3(Byte a, Byte b, Byte c) {
  return Max(Min(a, b), Min(Max(a, b), c));
}

// Word by word, so that the compiler does many pixels at once.
void KeepAlpha(const Byte* __restrict row, Byte* __restrict dst, int n) {
  for (int i = 0; i < n; i += 4) {
    std::uint32_t d, r;
    std::memcpy(&d, dst + i, 4);
    std::memcpy(&r, row + i, 4);
    d = (d & 0x00FFFFFFu) | (r & 0xFF000000u);
    std::memcpy(dst + i, &d, 4);
  }
}

void PlainSharpenRow(const Byte* __restrict above, const Byte* __restrict row,
                     const Byte* __restrict below, Byte* __restrict dst, int n) {
  // Every sum lies in -1020..1275, so 16 bits hold it.
  for (int i = 0; i < n; ++i) {
    const auto v =
        static_cast<std::int16_t>(5 * row[i] - above[i] - below[i] - row[i - 4] - row[i + 4]);
    const std::int16_t low = v < 0 ? 0 : v;
    dst[i] = static_cast<Byte>(low > 255 ? 255 : low);
  }
  KeepAlpha(row, dst, n);
}

// The median of a 3 x 3 block is the median of three values: the largest of the three column
// minima, the median of the three column medians and the smallest of the three column maxima.
// Each column is sorted once and serves three neighbouring pixels; only min and max are used,
// so many bytes go at once. Any way of finding the median gives the same value.
void PlainMedianRow(const Byte* __restrict above, const Byte* __restrict row,
                    const Byte* __restrict below, Byte* __restrict dst, int n) {
  Byte lo[kChunk + 8], mid[kChunk + 8], hi[kChunk + 8];
  for (int first = 0; first < n; first += kChunk) {
    const int count = std::min(kChunk, n - first);
    const int from = first - 4;
    for (int i = 0; i < count + 8; ++i) {
      const Byte a = above[from + i], b = row[from + i], c = below[from + i];
      const Byte small = Min(a, b), large = Max(a, b);
      lo[i] = Min(small, c);
      hi[i] = Max(large, c);
      mid[i] = Max(small, Min(large, c));
    }
    for (int i = 0; i < count; ++i) {
      const Byte maxLo = Max(Max(lo[i], lo[i + 4]), lo[i + 8]);
      const Byte minHi = Min(Min(hi[i], hi[i + 4]), hi[i + 8]);
      dst[first + i] = Median3(maxLo, Median3(mid[i], mid[i + 4], mid[i + 8]), minHi);
    }
  }
  KeepAlpha(row, dst, n);
}

#if defined(__x86_64__) && defined(__GNUC__)
// The same two rows 32 bytes at a time. Rows shorter than that take the plain routines; in
// longer ones the last 32 bytes overlap the ones before, which come out the same again.

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Load(const Byte* p) {
  return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
}
[[gnu::target("avx2"), gnu::always_inline]] inline void Store(Byte* p, __m256i v) {
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(p), v);
}
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i WithAlphaOf(__m256i v, __m256i row) {
  return _mm256_blendv_epi8(v, row, _mm256_set1_epi32(static_cast<int>(0xFF000000u)));
}

// 5 c - (a + b + l + r) on 16-bit words.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i SharpenWords(__m256i c, __m256i a,
                                                                        __m256i b, __m256i l,
                                                                        __m256i r) {
  const __m256i sides = _mm256_add_epi16(_mm256_add_epi16(a, b), _mm256_add_epi16(l, r));
  return _mm256_sub_epi16(_mm256_add_epi16(_mm256_slli_epi16(c, 2), c), sides);
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Sharpen32(const Byte* above,
                                                                     const Byte* row,
                                                                     const Byte* below) {
  const __m256i z = _mm256_setzero_si256();
  const __m256i c = Load(row), l = Load(row - 4), r = Load(row + 4);
  const __m256i a = Load(above), b = Load(below);
  const __m256i low = SharpenWords(_mm256_unpacklo_epi8(c, z), _mm256_unpacklo_epi8(a, z),
                                   _mm256_unpacklo_epi8(b, z), _mm256_unpacklo_epi8(l, z),
                                   _mm256_unpacklo_epi8(r, z));
  const __m256i high = SharpenWords(_mm256_unpackhi_epi8(c, z), _mm256_unpackhi_epi8(a, z),
                                    _mm256_unpackhi_epi8(b, z), _mm256_unpackhi_epi8(l, z),
                                    _mm256_unpackhi_epi8(r, z));
  // Packing with unsigned saturation is the clamp to 0..255 and undoes the unpacking's order.
  return WithAlphaOf(_mm256_packus_epi16(low, high), c);
}

[[gnu::target("avx2")]] void Avx2SharpenRow(const Byte* above, const Byte* row, const Byte* below,
                                            Byte* dst, int n) {
  if (n < 32) return PlainSharpenRow(above, row, below, dst, n);
  int i = 0;
  for (; i + 32 <= n; i += 32) Store(dst + i, Sharpen32(above + i, row + i, below + i));
  if (i < n) Store(dst + n - 32, Sharpen32(above + n - 32, row + n - 32, below + n - 32));
}

// The sorted columns (lo <= mid <= hi) of 32 bytes of three rows.
[[gnu::target("avx2"), gnu::always_inline]] inline void SortColumns32(
    const Byte* above, const Byte* row, const Byte* below, __m256i& lo, __m256i& mid, __m256i& hi) {
  const __m256i a = Load(above), b = Load(row), c = Load(below);
  const __m256i small = _mm256_min_epu8(a, b), large = _mm256_max_epu8(a, b);
  lo = _mm256_min_epu8(small, c);
  hi = _mm256_max_epu8(large, c);
  mid = _mm256_max_epu8(small, _mm256_min_epu8(large, c));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Median3x32(__m256i a, __m256i b,
                                                                      __m256i c) {
  return _mm256_max_epu8(_mm256_min_epu8(a, b), _mm256_min_epu8(_mm256_max_epu8(a, b), c));
}

// Each column is sorted three times here, once for each pixel it serves, straight from the
// rows: keeping the sorts in memory for the neighbours to read back, as the plain routine does,
// was slower, the stores and loads costing more than the sorting.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Median32(const Byte* above,
                                                                    const Byte* row,
                                                                    const Byte* below) {
  __m256i lo[3], mid[3], hi[3];
  for (int k = 0; k < 3; ++k) {
    const int at = 4 * (k - 1);
    SortColumns32(above + at, row + at, below + at, lo[k], mid[k], hi[k]);
  }
  const __m256i maxLo = _mm256_max_epu8(_mm256_max_epu8(lo[0], lo[1]), lo[2]);
  const __m256i minHi = _mm256_min_epu8(_mm256_min_epu8(hi[0], hi[1]), hi[2]);
  return WithAlphaOf(Median3x32(maxLo, Median3x32(mid[0], mid[1], mid[2]), minHi), Load(row));
}

[[gnu::target("avx2")]] void Avx2MedianRow(const Byte* above, const Byte* row, const Byte* below,
                                           Byte* dst, int n) {
  if (n < 32) return PlainMedianRow(above, row, below, dst, n);
  int i = 0;
  for (; i + 32 <= n; i += 32) Store(dst + i, Median32(above + i, row + i, below + i));
  if (i < n) Store(dst + n - 32, Median32(above + n - 32, row + n - 32, below + n - 32));
}
#endif

struct RowKernels {
  RowKernel sharpen;
  RowKernel median;
};

RowKernels ChooseKernels() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return {Avx2SharpenRow, Avx2MedianRow};
#endif
  return {PlainSharpenRow, PlainMedianRow};
}

// Runs kernel on every interior row of in into out.
void InteriorPass(const Bitmap32& in, Bitmap32& out, std::size_t workPerPixel, RowKernel kernel) {
  const int w = in.Width();
  const int h = in.Height();
  if (w < 3 || h < 3) return;
  const auto bytes = [](const Pixel* p) { return reinterpret_cast<const Byte*>(p); };
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * workPerPixel, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y)
      kernel(bytes(in.ScanLine(y - 1) + 1), bytes(in.ScanLine(y) + 1),
             bytes(in.ScanLine(y + 1) + 1), reinterpret_cast<Byte*>(out.ScanLine(y) + 1),
             4 * (w - 2));
  });
}

// Columns per tile of the fused passes: the rows that the passes keep of a tile stay in the
// second-level cache. Tiles much narrower than that were slower, not faster: the source and
// result are then read and written in short pieces of many rows, which the processor's
// prefetching follows less well.
constexpr int kTile = 4096;

// All the passes, one after another, over rows y0..y1-1 and columns c0..c1-1 of the interior,
// into out. Each pass keeps only its last three rows; the rows of one pass are made as soon as
// the rows of the pass before them are, so that every row is read back from the cache. A pass
// with more passes after it covers that many more rows and columns on each side, so the tile
// needs nothing from its neighbours. The rings hold columns lo..hi-1, the widest any pass reads.
void PassesOnTile(const RowKernels& kernels, const Bitmap32& source, int passes, int y0, int y1,
                  int c0, int c1, Pixel* rings, Bitmap32& out) {
  const int w = source.Width();
  const int h = source.Height();
  const int lo = std::max(0, c0 - passes);
  const int hi = std::min(w, c1 + passes);
  const std::size_t span = static_cast<std::size_t>(hi - lo);
  // Row r after pass p (1 .. passes - 1), from column lo on.
  const auto slot = [&](int p, int r) {
    return rings + (static_cast<std::size_t>(p - 1) * 3 + static_cast<std::size_t>(r % 3)) * span;
  };
  // The first and last rows are never written, so every pass reads them from the source.
  const auto input = [&](int p, int r) {
    const Pixel* row = p == 0 || r == 0 || r == h - 1 ? source.ScanLine(r) + lo : slot(p, r);
    return reinterpret_cast<const Byte*>(row);
  };
  for (int t = y0 - passes + 1; t < y1 + passes; ++t)
    for (int p = 1; p <= passes; ++p) {
      const int r = t - p;
      const int reach = passes - p;
      if (r < std::max(1, y0 - reach) || r >= std::min(h - 1, y1 + reach)) continue;
      const int x0 = std::max(1, c0 - reach);
      const int x1 = std::min(w - 1, c1 + reach);
      const std::size_t at = 4 * static_cast<std::size_t>(x0 - lo);
      Byte* dst = p == passes ? reinterpret_cast<Byte*>(out.ScanLine(r) + x0)
                              : reinterpret_cast<Byte*>(slot(p, r)) + at;
      const RowKernel kernel = p % 3 == 1 ? kernels.sharpen : kernels.median;
      kernel(input(p - 1, r - 1) + at, input(p - 1, r) + at, input(p - 1, r + 1) + at, dst,
             4 * (x1 - x0));
      if (p == passes) continue;
      // The frame columns, where the next pass reads them.
      Pixel* ring = slot(p, r);
      if (lo == 0) ring[0] = source.ScanLine(r)[0];
      if (hi == w) ring[w - 1 - lo] = source.ScanLine(r)[w - 1];
    }
}

}  // namespace

void SharpenPass(const Bitmap32& in, Bitmap32& out) {
  InteriorPass(in, out, 6, ChooseKernels().sharpen);
}

void MedianPass(const Bitmap32& in, Bitmap32& out) {
  InteriorPass(in, out, 8, ChooseKernels().median);
}

Bitmap32 WaterColor(const Bitmap32& source, int cycles) {
  Bitmap32 picture = Bitmap32::ForOverwrite(source.Width(), source.Height());
  WaterColorInto(source, cycles, picture);
  return picture;
}

void WaterColorInto(const Bitmap32& source, int cycles, Bitmap32& out) {
  const int w = source.Width();
  const int h = source.Height();
  const std::size_t bytes = source.PixelCount() * sizeof(Pixel);
  if (bytes == 0) return;
  if (w < 3 || h < 3 || cycles < 1) {
    std::memcpy(static_cast<void*>(out.Data()), source.Data(), bytes);
    return;
  }
  const RowKernels kernels = ChooseKernels();
  const int passes = 3 * cycles;
  const int tiles = (w - 2 + kTile - 1) / kTile;
  const int widest = (w - 2 + tiles - 1) / tiles;
  const std::size_t ringPixels = static_cast<std::size_t>(passes - 1) * 3 *
                                 static_cast<std::size_t>(std::min(w, widest + 2 * passes));
  const std::size_t rowBytes = static_cast<std::size_t>(w) * sizeof(Pixel);
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * 8 * static_cast<std::size_t>(passes),
               [&](int y0, int y1) {
                 std::vector<Pixel> rings(ringPixels);
                 const auto tileStart = [&](int i) {
                   return 1 + static_cast<int>(static_cast<long long>(w - 2) * i / tiles);
                 };
                 for (int i = 0; i < tiles; ++i)
                   PassesOnTile(kernels, source, passes, y0, y1, tileStart(i), tileStart(i + 1),
                                rings.data(), out);
                 // The frame keeps the source.
                 for (int y = y0; y < y1; ++y) {
                   out.ScanLine(y)[0] = source.ScanLine(y)[0];
                   out.ScanLine(y)[w - 1] = source.ScanLine(y)[w - 1];
                 }
                 if (y0 == 1) std::memcpy(out.ScanLine(0), source.ScanLine(0), rowBytes);
                 if (y1 == h - 1)
                   std::memcpy(out.ScanLine(h - 1), source.ScanLine(h - 1), rowBytes);
               });
}

const EffectSpec& WaterColorEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 5,
      .menuEntry = "Water color",
      .menuObjectName = "Watercolor1",
      .windowObjectName = "TWater_Color",
      .caption = "Water_Color",
      .statusText = "Water color",
      .cliName = "water-color",
      .batchTag = "WaterColor",
      .collapsedHeight = 103,
      .expandedHeight = 184,
      .batchPushesHistory = true,
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              {.name = "scope",
               .objectName = "TrackBar2",
               .captionLabel = "Label2",
               .caption = "Scope:",
               .minimum = 1,
               .maximum = 5,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "cycles of sharpening and two median passes"},
          },
      .reference = {.hash = 0xe2b296672cd83970,
                    .topLeft = 0x88522e,
                    .centre = 0x928c87,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) { return WaterColor(in.source, in.params.GetInt("scope")); },
  };
  return entry;
}

}  // namespace quillane
