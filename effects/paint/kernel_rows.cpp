// The kernel passes' rows, compiled twice: plain loops over 16- or 32-bit sums that any x86-64
// widens, and an AVX2 variant chosen once per pass when this processor has the instructions.
#include "effects/paint/kernel_rows.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// Bytes of a row handled per round of the plain variant: its sums stay in the first-level
// cache.
constexpr int kSumChunk = 1024;

// One tap over a stretch of bytes, on its own so that the compiler sees that nothing else
// overlaps and handles many bytes at once.
template <typename Sum>
void AddTap(const std::uint8_t* __restrict src, Sum weight, Sum* __restrict sums, int count) {
  for (int i = 0; i < count; ++i) sums[i] = static_cast<Sum>(sums[i] + weight * src[i]);
}

// The gradients weigh one column of three against the next but one: each column's weighted
// sum is formed once and serves both neighbours. sums[i] = sign (column(i - 4) - column(i + 4))
// over byte first + i, with the middle row weighing middle.
template <typename Sum>
void GradientSums(const std::uint8_t* const rows[3], int first, int count, int middle, int sign,
                  Sum* __restrict sums) {
  Sum columns[kSumChunk + 8];
  const std::uint8_t* __restrict above = rows[0] + first - 4;
  const std::uint8_t* __restrict row = rows[1] + first - 4;
  const std::uint8_t* __restrict below = rows[2] + first - 4;
  for (int i = 0; i < count + 8; ++i)
    columns[i] = static_cast<Sum>(above[i] + middle * row[i] + below[i]);
  for (int i = 0; i < count; ++i) sums[i] = static_cast<Sum>(sign * (columns[i] - columns[i + 8]));
}

// A sum limited to 0..255, by value so that the compiler does many at once.
template <typename Sum>
inline std::uint8_t Clamp(Sum v) {
  const Sum low = v < 0 ? 0 : v;
  return static_cast<std::uint8_t>(low > 255 ? 255 : low);
}

template <typename Sum, typename Taps>
void PlainSums(const Taps& taps, std::optional<ColumnGradient> gradient,
               const std::uint8_t* const rows[3], int w, std::uint8_t* dst) {
  const int bytes = 4 * w;
  Sum sums[kSumChunk];
  Sum gradientSums[kSumChunk];
  for (int first = 4; first < bytes - 4; first += kSumChunk) {
    const int count = std::min(kSumChunk, bytes - 4 - first);
    std::fill(sums, sums + count, Sum{0});
    for (const auto& t : taps)
      AddTap<Sum>(rows[t.row] + first + t.offset, static_cast<Sum>(t.weight), sums, count);
    if (gradient) {
      GradientSums(rows, first, count, gradient->middle, gradient->sign, gradientSums);
      for (int i = 0; i < count; ++i)
        dst[first + i] = static_cast<std::uint8_t>(255 - Clamp(std::max(sums[i], gradientSums[i])));
    } else {
      for (int i = 0; i < count; ++i) dst[first + i] = Clamp(sums[i]);
    }
  }
  for (int x = 1; x < w - 1; ++x) dst[4 * x + 3] = 255;
}

#if defined(__x86_64__) && defined(__GNUC__)
// The weights as the multiply-add of unsigned bytes by signed ones wants them: byte pairs of
// (left, right), (above, below) or (centre, 0) neighbours, interleaved from two loads.
// Whichever two weights share a pair, their magnitudes add up to at most 128, so no pair's
// sum of products saturates (128 * 255 < 32768), and neither does the sum of all five.
struct Avx2Weights {
  __m256i pair[5];
  bool used[5];
  __m256i gradientSide;
  __m256i gradientMiddle;
};

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i BytePair(int first, int second) {
  return _mm256_set1_epi16(static_cast<std::int16_t>(static_cast<std::uint16_t>(
      (static_cast<std::uint8_t>(second) << 8) | static_cast<std::uint8_t>(first))));
}

[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Load(const std::uint8_t* p) {
  return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p));
}

[[gnu::target("avx2"), gnu::always_inline]] inline void Store(std::uint8_t* p, __m256i v) {
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(p), v);
}

// lo and hi gain the pair's weighted sums of the bytes x and y, interleaved.
[[gnu::target("avx2"), gnu::always_inline]] inline void AddPair(__m256i xy0, __m256i xy1,
                                                                __m256i weights, __m256i& lo,
                                                                __m256i& hi) {
  lo = _mm256_add_epi16(lo, _mm256_maddubs_epi16(xy0, weights));
  hi = _mm256_add_epi16(hi, _mm256_maddubs_epi16(xy1, weights));
}

// The finished 32 bytes from byte j on. The sums come in two halves of interleaved bytes;
// packing with unsigned saturation clamps them to 0..255 and restores the order.
template <bool kGradient>
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Bytes32(const Avx2Weights& k,
                                                                   const std::uint8_t* above,
                                                                   const std::uint8_t* row,
                                                                   const std::uint8_t* below,
                                                                   int j) {
  const __m256i zero = _mm256_setzero_si256();
  __m256i lo = zero, hi = zero;
  __m256i sides[3][2];
  const std::uint8_t* rows[3] = {above + j, row + j, below + j};
  for (int r = 0; r < 3; ++r)
    if (kGradient || k.used[r]) {
      const __m256i left = Load(rows[r] - 4), right = Load(rows[r] + 4);
      sides[r][0] = _mm256_unpacklo_epi8(left, right);
      sides[r][1] = _mm256_unpackhi_epi8(left, right);
      if (k.used[r]) AddPair(sides[r][0], sides[r][1], k.pair[r], lo, hi);
    }
  if (k.used[3]) {
    const __m256i up = Load(rows[0]), down = Load(rows[2]);
    AddPair(_mm256_unpacklo_epi8(up, down), _mm256_unpackhi_epi8(up, down), k.pair[3], lo, hi);
  }
  if (k.used[4]) {
    const __m256i centre = Load(rows[1]);
    AddPair(_mm256_unpacklo_epi8(centre, zero), _mm256_unpackhi_epi8(centre, zero), k.pair[4], lo,
            hi);
  }
  const __m256i alpha = _mm256_set1_epi32(static_cast<std::int32_t>(0xFF000000u));
  if constexpr (!kGradient) {
    return _mm256_or_si256(_mm256_packus_epi16(lo, hi), alpha);
  } else {
    __m256i glo = zero, ghi = zero;
    AddPair(sides[0][0], sides[0][1], k.gradientSide, glo, ghi);
    AddPair(sides[1][0], sides[1][1], k.gradientMiddle, glo, ghi);
    AddPair(sides[2][0], sides[2][1], k.gradientSide, glo, ghi);
    // The clamp is monotonic, so the larger clamped response is the clamped larger one.
    const __m256i v = _mm256_packus_epi16(_mm256_max_epi16(lo, glo), _mm256_max_epi16(hi, ghi));
    return _mm256_or_si256(_mm256_xor_si256(v, _mm256_set1_epi8(-1)), alpha);
  }
}

// Bytes 4 .. 4w - 5 of out, for w - 2 >= 8 pixels and out 4-byte aligned. Vectors that overlap the
// first and last aligned ones give the same bytes twice; in between, the result streams past the
// caches: it is far larger than they are, and streaming spares reading each line of it before
// writing it.
template <bool kGradient>
[[gnu::target("avx2")]] void Avx2Row(const std::array<std::int8_t, 10>& weights,
                                     std::optional<ColumnGradient> gradient,
                                     const std::uint8_t* above, const std::uint8_t* row,
                                     const std::uint8_t* below, int w, std::uint8_t* out) {
  Avx2Weights k;
  k.gradientSide = k.gradientMiddle = _mm256_setzero_si256();
  for (int p = 0; p < 5; ++p) {
    k.pair[p] = BytePair(weights[2 * p], weights[2 * p + 1]);
    k.used[p] = weights[2 * p] != 0 || weights[2 * p + 1] != 0;
  }
  if (gradient) {
    k.gradientSide = BytePair(gradient->sign, -gradient->sign);
    k.gradientMiddle =
        BytePair(gradient->sign * gradient->middle, -gradient->sign * gradient->middle);
  }
  const int first = 4;
  const int end = 4 * (w - 1);
  Store(out + first, Bytes32<kGradient>(k, above, row, below, first));
  const auto address = reinterpret_cast<std::uintptr_t>(out);
  int j = first + static_cast<int>((32 - (address + first) % 32) % 32);
  for (; j + 32 <= end; j += 32)
    _mm256_stream_si256(reinterpret_cast<__m256i*>(out + j),
                        Bytes32<kGradient>(k, above, row, below, j));
  if (j < end) Store(out + end - 32, Bytes32<kGradient>(k, above, row, below, end - 32));
}
#endif

}  // namespace

ParamSpec KernelParam(EffectParams::Values defaults) {
  return {
      .kind = ParamKind::Cells,
      .name = "kernel",
      .captionLabel = "Label1",
      .caption = "You can change the figures",
      .minimum = std::numeric_limits<std::int32_t>::min(),
      .maximum = std::numeric_limits<std::int32_t>::max(),
      .cells = {"Edit1", "Edit2", "Edit3", "Edit4", "Edit5", "Edit6", "Edit7", "Edit8", "Edit9"},
      .defaultList = std::move(defaults),
      .hint = "Change the number to get different effect",
      .help = "the 3 x 3 weights, row by row (top row first)"};
}

Kernel KernelFrom(const EffectParams::Values& values) {
  if (values.size() != 9) throw std::invalid_argument("a kernel has nine cells");
  Kernel k{};
  for (std::size_t i = 0; i < 9; ++i) {
    // Wider weights could overflow even the 64-bit sums.
    if (values[i] < INT32_MIN || values[i] > INT32_MAX)
      throw std::invalid_argument("a kernel's cells are 32-bit integers");
    k[i] = values[i];
  }
  return k;
}

std::optional<KernelRowPass> KernelRowPass::Make(const Kernel& k,
                                                 std::optional<ColumnGradient> gradient) {
  std::int64_t magnitude = 0;
  for (std::int64_t w : k) magnitude += w < 0 ? -w : w;
  KernelRowPass pass;
  pass.gradient_ = gradient;
  pass.wide_ = magnitude > 128;
  // |sum| <= magnitude * 255 must fit 32 bits.
  if (magnitude > std::numeric_limits<std::int32_t>::max() / 255) return std::nullopt;
  for (int t = 0; t < 9; ++t)
    if (k[static_cast<std::size_t>(t)] != 0)
      pass.taps_.push_back(
          {t / 3, (t % 3 - 1) * 4, static_cast<std::int32_t>(k[static_cast<std::size_t>(t)])});
  // Only a lone weight of 128 misses a signed byte.
  const bool bytes = std::all_of(k.begin(), k.end(), [](std::int64_t w) { return w < 128; });
  if (!pass.wide_ && bytes && UseAvx2()) {
    const auto at = [&k](int t) {
      return static_cast<std::int8_t>(k[static_cast<std::size_t>(t)]);
    };
    pass.pairs_ = {at(0), at(2), at(3), at(5), at(6), at(8), at(1), at(7), at(4), 0};
  }
  return pass;
}

void KernelRowPass::PlainRow(const std::uint8_t* const rows[3], int w, std::uint8_t* dst) const {
  if (wide_)
    PlainSums<std::int32_t>(taps_, gradient_, rows, w, dst);
  else
    PlainSums<std::int16_t>(taps_, gradient_, rows, w, dst);
}

void KernelRowPass::Row(const Pixel* above, const Pixel* row, const Pixel* below, int w,
                        Pixel* out) const {
  const std::uint8_t* rows[3] = {reinterpret_cast<const std::uint8_t*>(above),
                                 reinterpret_cast<const std::uint8_t*>(row),
                                 reinterpret_cast<const std::uint8_t*>(below)};
  auto* dst = reinterpret_cast<std::uint8_t*>(out);
#if defined(__x86_64__) && defined(__GNUC__)
  // Streaming wants whole pixels on aligned addresses, as pictures' rows always are.
  if (pairs_ && w - 2 >= 8 && reinterpret_cast<std::uintptr_t>(out) % 4 == 0) {
    if (gradient_)
      Avx2Row<true>(*pairs_, gradient_, rows[0], rows[1], rows[2], w, dst);
    else
      Avx2Row<false>(*pairs_, gradient_, rows[0], rows[1], rows[2], w, dst);
    return;
  }
#endif
  PlainRow(rows, w, dst);
}

void KernelRowPass::EndBand() {
#if defined(__x86_64__)
  _mm_sfence();
#endif
}

}  // namespace quillane
