#include "effects/paint/brume.h"

#include <algorithm>
#include <array>
#include <cstring>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "effects/registry.h"
#include "imaging/parallel.h"
#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

constexpr std::uint32_t kMultiplier = 134775813u;

// seed -> mul * seed + add, the effect of some number of steps.
struct Affine {
  std::uint32_t mul = 1;
  std::uint32_t add = 0;
  // This map after first.
  constexpr Affine After(const Affine& first) const {
    return {mul * first.mul, mul * first.add + add};
  }
  constexpr std::uint32_t operator()(std::uint32_t seed) const { return mul * seed + add; }
};

constexpr Affine Steps(std::uint64_t steps) {
  Affine result;
  Affine power{kMultiplier, 1};
  for (; steps != 0; steps >>= 1) {
    if (steps & 1) result = power.After(result);
    power = power.After(power);
  }
  return result;
}

inline std::uint32_t Scaled(std::uint32_t seed, std::uint32_t range) {
  return static_cast<std::uint32_t>((static_cast<std::uint64_t>(range) * seed) >> 32);
}

// A row's output: pixels 1 .. width-1 of row y from the draws that follow seed.
using BrumeRow = void (*)(const Bitmap32& source, int scope, int y, std::uint32_t seed, Pixel* row);

// Lanes of the generator run side by side, each kLanes steps ahead of the last, so that the
// next value never waits on the one before.
constexpr int kLanes = 8;

// Pixel x of row y from its two draws.
inline void Pick(const Bitmap32& source, int scope, int y, int x, std::uint32_t rowSeed,
                 std::uint32_t columnSeed, Pixel* row) {
  const int w = source.Width();
  const auto range = static_cast<std::uint32_t>(scope + 3);
  const int ry =
      std::clamp(static_cast<int>(Scaled(rowSeed, range)) + y - scope, 0, source.Height() - 1);
  const int rx = std::clamp(static_cast<int>(Scaled(columnSeed, range)) + x - scope, 0, w - 1);
  const Pixel p = source.Data()[static_cast<std::size_t>(ry) * static_cast<std::size_t>(w) +
                                static_cast<std::size_t>(rx)];
  row[x] = Pixel{p.b, p.g, p.r, 255};
}

void PlainBrumeRow(const Bitmap32& source, int scope, int y, std::uint32_t seed, Pixel* row) {
  const int w = source.Width();
  constexpr Affine lanesAhead = Steps(kLanes);
  std::array<std::uint32_t, kLanes> lane;
  for (std::uint32_t& l : lane) l = seed = kMultiplier * seed + 1;
  int x = 1;
  // kLanes / 2 pixels per round, each taking a row draw and then a column draw.
  for (; x + kLanes / 2 <= w; x += kLanes / 2) {
    for (int i = 0; i < kLanes / 2; ++i)
      Pick(source, scope, y, x + i, lane[2 * i], lane[2 * i + 1], row);
    for (std::uint32_t& l : lane) l = lanesAhead(l);
  }
  // The last few pixels of the row take the lanes in order.
  for (int i = 0; x < w; ++x, i += 2) Pick(source, scope, y, x, lane[i], lane[i + 1], row);
}

#if defined(__x86_64__) && defined(__GNUC__)
// The upper halves of range * seed for eight seeds.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Scaled8(__m256i seeds, __m256i range) {
  const __m256i even = _mm256_srli_epi64(_mm256_mul_epu32(seeds, range), 32);
  const __m256i odd = _mm256_mul_epu32(_mm256_srli_epi64(seeds, 32), range);
  return _mm256_blend_epi32(even, odd, 0xAA);
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Clamp8(__m256i v, __m256i high) {
  return _mm256_min_epi32(_mm256_max_epi32(v, _mm256_setzero_si256()), high);
}

// Eight pixels a round: one register holds their row draws and another their column draws, and
// every lane moves 16 steps on after the round. The picked pixels are fetched one by one by
// their index in the picture (which 32 bits hold for any picture the program accepts): the
// gather instruction was three times slower here.
[[gnu::target("avx2")]] void Avx2BrumeRow(const Bitmap32& source, int scope, int y,
                                          std::uint32_t seed, Pixel* row) {
  static_assert(Bitmap32::kMaxPixels <= std::int64_t{1} << 31);
  const int w = source.Width();
  const int h = source.Height();
  alignas(32) std::uint32_t rowSeeds[8], columnSeeds[8];
  for (int i = 0; i < 8; ++i) {
    rowSeeds[i] = seed = kMultiplier * seed + 1;
    columnSeeds[i] = seed = kMultiplier * seed + 1;
  }
  constexpr Affine ahead = Steps(16);
  const __m256i mul = _mm256_set1_epi32(static_cast<int>(ahead.mul));
  const __m256i add = _mm256_set1_epi32(static_cast<int>(ahead.add));
  const __m256i range = _mm256_set1_epi32(scope + 3);
  const __m256i rowShift = _mm256_set1_epi32(y - scope);
  const __m256i lastRow = _mm256_set1_epi32(h - 1);
  const __m256i lastColumn = _mm256_set1_epi32(w - 1);
  const __m256i width = _mm256_set1_epi32(w);
  // x - scope for the eight pixels of a round.
  __m256i columnShift =
      _mm256_add_epi32(_mm256_setr_epi32(1, 2, 3, 4, 5, 6, 7, 8), _mm256_set1_epi32(-scope));
  __m256i rows = _mm256_load_si256(reinterpret_cast<const __m256i*>(rowSeeds));
  __m256i columns = _mm256_load_si256(reinterpret_cast<const __m256i*>(columnSeeds));
  const Pixel* data = source.Data();
  int x = 1;
  for (; x + 8 <= w; x += 8) {
    const __m256i ry = Clamp8(_mm256_add_epi32(Scaled8(rows, range), rowShift), lastRow);
    const __m256i rx = Clamp8(_mm256_add_epi32(Scaled8(columns, range), columnShift), lastColumn);
    const __m256i at = _mm256_add_epi32(_mm256_mullo_epi32(ry, width), rx);
    alignas(32) std::uint32_t index[8];
    _mm256_store_si256(reinterpret_cast<__m256i*>(index), at);
    for (int i = 0; i < 8; ++i) {
      std::uint32_t picked;
      std::memcpy(&picked, data + index[i], 4);
      picked |= 0xFF000000u;
      std::memcpy(static_cast<void*>(row + x + i), &picked, 4);
    }
    rows = _mm256_add_epi32(_mm256_mullo_epi32(rows, mul), add);
    columns = _mm256_add_epi32(_mm256_mullo_epi32(columns, mul), add);
    columnShift = _mm256_add_epi32(columnShift, _mm256_set1_epi32(8));
  }
  if (x == w) return;
  // The last few pixels take the lanes in order.
  _mm256_store_si256(reinterpret_cast<__m256i*>(rowSeeds), rows);
  _mm256_store_si256(reinterpret_cast<__m256i*>(columnSeeds), columns);
  for (int i = 0; x < w; ++x, ++i) Pick(source, scope, y, x, rowSeeds[i], columnSeeds[i], row);
}
#endif

BrumeRow ChooseRow() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2BrumeRow;
#endif
  return PlainBrumeRow;
}

}  // namespace

std::uint32_t RandomDraw(std::uint32_t& seed, std::uint32_t range) {
  seed = kMultiplier * seed + 1;
  return Scaled(seed, range);
}

std::uint32_t RandomJump(std::uint32_t seed, std::uint64_t steps) {
  return Steps(steps)(seed);
}

Bitmap32 Brume(const Bitmap32& source, int scope, std::uint32_t& seed) {
  Bitmap32 out = Bitmap32::ForOverwrite(source.Width(), source.Height());
  BrumeInto(source, scope, seed, out);
  return out;
}

void BrumeInto(const Bitmap32& source, int scope, std::uint32_t& seed, Bitmap32& out) {
  const int w = source.Width();
  const int h = source.Height();
  if (w == 0) return;
  // Row 0 and column 0 keep the source; every other pixel is written below.
  std::memcpy(out.ScanLine(0), source.ScanLine(0), static_cast<std::size_t>(w) * sizeof(Pixel));
  for (int y = 1; y < h; ++y) out.ScanLine(y)[0] = source.ScanLine(y)[0];
  if (w < 2 || h < 2) {
    std::memcpy(out.Data(), source.Data(), source.PixelCount() * sizeof(Pixel));
    return;
  }
  // Each band of rows starts from the seed as it stands after the rows above it, so any split
  // draws exactly what one thread would.
  const std::uint64_t perRow = 2 * static_cast<std::uint64_t>(w - 1);
  const std::uint32_t start = seed;
  const Affine nextRow = Steps(perRow);
  const BrumeRow brumeRow = ChooseRow();
  ParallelRows(1, h, static_cast<std::size_t>(w) * 3, [&](int y0, int y1) {
    std::uint32_t rowSeed = RandomJump(start, perRow * static_cast<std::uint64_t>(y0 - 1));
    for (int y = y0; y < y1; ++y, rowSeed = nextRow(rowSeed))
      brumeRow(source, scope, y, rowSeed, out.ScanLine(y));
  });
  seed = RandomJump(start, perRow * static_cast<std::uint64_t>(h - 1));
}

const EffectSpec& BrumeEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 6,
      .menuEntry = "Brume",
      .menuObjectName = "Brume1",
      .windowObjectName = "TBrume",
      .caption = "Brume",
      .statusText = "Brume",
      .cliName = "brume",
      .batchTag = "Brume",
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
               .maximum = 10,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "how far colours travel: up to N pixels down and right, 2 up and left"},
          },
      .reference = {.hash = 0x7a58c4f68df92c52,
                    .topLeft = 0x88522e,
                    .centre = 0x969388,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            // Without the document's generator (a caller that keeps none) a run starts afresh.
            std::uint32_t fresh = 0;
            return Brume(in.source, in.params.GetInt("scope"), in.random ? *in.random : fresh);
          },
  };
  return entry;
}

}  // namespace quillane
