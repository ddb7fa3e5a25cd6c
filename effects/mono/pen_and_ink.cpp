// Pen and ink: the outlines of the dark areas of the photograph.
#include "effects/mono/pen_and_ink.h"

#include <algorithm>
#include <vector>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "effects/mono/pen_sketch.h"
#include "effects/registry.h"
#include "imaging/ink_rows.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// The ink gray is Round(sum / 1000) for the integer sum 299 R + 587 G + 110 B, so it is above
// the threshold t exactly when the sum is above 1000 t + 500; the extended-precision sum is
// within 1e-15 of sum / 1000 and rounds the same way everywhere but at an exact half, where
// its own rounding errors decide: there the gray is formed as InkGrayValue forms it.
int HalfAbove(int threshold) {
  return 1000 * threshold + 500;
}

int InkSum(const Pixel& p) {
  return 299 * p.r + 587 * p.g + 110 * p.b;
}

std::uint8_t CellOfHalf(const Pixel& p, int threshold) {
  return InkGrayValue(p.r, p.g, p.b) > threshold ? 0xFF : 0;
}

[[gnu::always_inline]] inline void InkCellLoop(const Pixel* __restrict in, int n, int threshold,
                                               std::uint8_t* __restrict cells) {
  const int half = HalfAbove(threshold);
  bool anyHalf = false;
  for (int x = 0; x < n; ++x) {
    const int sum = InkSum(in[x]);
    cells[x] = sum > half ? 0xFF : 0;
    anyHalf |= sum == half;
  }
  if (anyHalf)
    for (int x = 0; x < n; ++x)
      if (InkSum(in[x]) == half) cells[x] = CellOfHalf(in[x], threshold);
}

void PlainInkCells(const Pixel* in, int n, int threshold, std::uint8_t* cells) {
  InkCellLoop(in, n, threshold, cells);
}

// An interior pixel is cleared to paper when no paper lies among its eight neighbours.
[[gnu::always_inline]] inline void OutlineLoop(const std::uint8_t* __restrict above,
                                               const std::uint8_t* __restrict self,
                                               const std::uint8_t* __restrict below, int w,
                                               std::uint8_t* __restrict out) {
  out[0] = self[0];
  for (int x = 1; x < w - 1; ++x) {
    const auto paperNear =
        static_cast<std::uint8_t>(above[x - 1] | above[x] | above[x + 1] | self[x - 1] |
                                  self[x + 1] | below[x - 1] | below[x] | below[x + 1]);
    out[x] = static_cast<std::uint8_t>(self[x] | ~paperNear);
  }
  out[w - 1] = self[w - 1];
}

void PlainOutline(const std::uint8_t* above, const std::uint8_t* self, const std::uint8_t* below,
                  int w, std::uint8_t* out) {
  OutlineLoop(above, self, below, w, out);
}

#if defined(__x86_64__) && defined(__GNUC__)
// The sums of 8 pixels in order: the bytes widened to 16 bits, multiplied and added in pairs
// (blue with green, red with alpha), then the pairs added.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i InkSums8(const Pixel* in) {
  const __m256i weights = _mm256_set1_epi64x(0x0000012B024B006ELL);  // 110, 587, 299, 0
  const __m256i v = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in));
  const __m256i zero = _mm256_setzero_si256();
  return _mm256_hadd_epi32(_mm256_madd_epi16(_mm256_unpacklo_epi8(v, zero), weights),
                           _mm256_madd_epi16(_mm256_unpackhi_epi8(v, zero), weights));
}

// 32 masks of 32 bits as 32 bytes, in order: packing works within halves of the register, so
// the order is restored at the end.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Bytes32(const __m256i* m) {
  return _mm256_permutevar8x32_epi32(
      _mm256_packs_epi16(_mm256_packs_epi32(m[0], m[1]), _mm256_packs_epi32(m[2], m[3])),
      _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
}

// 32 pixels at a time; the exact halves come out as a bit mask.
[[gnu::target("avx2")]] void Avx2InkCells(const Pixel* in, int n, int threshold,
                                          std::uint8_t* cells) {
  const __m256i half = _mm256_set1_epi32(HalfAbove(threshold));
  int x = 0;
  for (; x + 32 <= n; x += 32) {
    __m256i paper[4], halves[4];
    for (int i = 0; i < 4; ++i) {
      const __m256i sums = InkSums8(in + x + 8 * i);
      paper[i] = _mm256_cmpgt_epi32(sums, half);
      halves[i] = _mm256_cmpeq_epi32(sums, half);
    }
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(cells + x), Bytes32(paper));
    for (auto mask = static_cast<std::uint32_t>(_mm256_movemask_epi8(Bytes32(halves))); mask != 0;
         mask &= mask - 1) {
      const int i = x + __builtin_ctz(mask);
      cells[i] = CellOfHalf(in[i], threshold);
    }
  }
  InkCellLoop(in + x, n - x, threshold, cells + x);
}

[[gnu::target("avx2")]] void Avx2Outline(const std::uint8_t* above, const std::uint8_t* self,
                                         const std::uint8_t* below, int w, std::uint8_t* out) {
  OutlineLoop(above, self, below, w, out);
}
#endif

using InkCellRow = void (*)(const Pixel*, int, int, std::uint8_t*);
using OutlineRow = void (*)(const std::uint8_t*, const std::uint8_t*, const std::uint8_t*, int,
                            std::uint8_t*);

InkCellRow ChooseInkCells() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2InkCells;
#endif
  return PlainInkCells;
}

OutlineRow ChooseOutline() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2Outline;
#endif
  return PlainOutline;
}

}  // namespace

std::uint8_t InkGrayValue(int r, int g, int b) {
  return static_cast<std::uint8_t>(ClampByte(Round(0.299L * r + 0.587L * g + 0.11L * b)));
}

void InkThresholdCells(const Pixel* in, int count, int threshold, std::uint8_t* cells) {
  // No gray value is below 0 or above 254.
  ChooseInkCells()(in, count, std::clamp(threshold, -1, 255), cells);
}

Bitmap32 PenAndInk(const Bitmap32& source, int threshold, bool colorInk) {
  const int w = source.Width(), h = source.Height();
  Bitmap32 result = ScratchPicture(w, h);
  if (result.Empty()) return result;
  threshold = std::clamp(threshold, -1, 255);
  const InkCellRow inkCells = ChooseInkCells();
  const OutlineRow outline = ChooseOutline();
  const auto width = static_cast<std::size_t>(w);
  ParallelRows(0, h, width * 6, [&](int y0, int y1) {
    // Paper (0xFF) or ink (0) of the rows around the one being written, three at a time, so no
    // row is thresholded more than once within the band.
    std::vector<std::uint8_t> rings(3 * width), cleared(width);
    const auto paper = [&](int y) {
      return rings.data() + static_cast<std::size_t>(y % 3) * width;
    };
    const auto thresholdRow = [&](int y) { inkCells(source.ScanLine(y), w, threshold, paper(y)); };
    if (y0 > 0) thresholdRow(y0 - 1);
    thresholdRow(y0);
    for (int y = y0; y < y1; ++y) {
      if (y + 1 < h) thresholdRow(y + 1);
      // The border rows and columns keep their thresholded pixels.
      const std::uint8_t* cells = paper(y);
      if (y > 0 && y < h - 1 && w >= 3) {
        outline(paper(y - 1), paper(y), paper(y + 1), w, cleared.data());
        cells = cleared.data();
      }
      InkPixels(cells, w, result.ScanLine(y), colorInk ? source.ScanLine(y) : nullptr);
    }
    EndStreamedRows();
  });
  return result;
}

const EffectSpec& PenAndInkEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Mono,
      .menuPosition = 4,
      .menuEntry = "Pen && Ink",
      .menuObjectName = "PenInk1",
      .windowObjectName = "TPen_and_Ink",
      .caption = "Pen_and_Ink",
      .statusText = "Pen and Ink",
      .cliName = "pen-and-ink",
      .batchTag = "Pen_and_Ink",
      .collapsedHeight = 109,
      .expandedHeight = 186,
      .colorUp = true,
      .batchPushesHistory = true,
      .lineArtAfterApply = true,
      .params =
          {
              {.name = "adjust-thread",
               .objectName = "TrackBar1",
               .captionLabel = "Label8",
               .caption = "Adjust thread:",
               .maximum = 255,
               .defaultValue = 128,
               .numberLabel = "Label9",
               .initialNumber = "128",
               .help = "gray level at or below which the photograph is inked"},
              {.kind = ParamKind::Switch,
               .name = "color-ink",
               .objectName = "CheckBox1",
               .caption = "Color Ink",
               .maximum = 1,
               .help = "the outlines take the photograph's colours"},
          },
      .reference = {.hash = 0xf80d1c482dce032c,
                    .topLeft = 0x000000,
                    .centre = 0xffffff,
                    .bottomRight = 0x000000},
      .routine =
          [](const EffectInput& in) {
            return PenAndInk(in.source, in.params.GetInt("adjust-thread"),
                             in.params.Get("color-ink") != 0);
          },
  };
  return entry;
}

}  // namespace quillane
