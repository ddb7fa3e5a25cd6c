#include "effects/paint/kernel_rows.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <optional>

namespace quillane {
namespace {

// One tap over a stretch of bytes, on its own so that the compiler sees that nothing else
// overlaps and handles many bytes at once.
void AddTap(const std::uint8_t* __restrict src, std::int16_t weight, std::int16_t* __restrict sums,
            int count) {
  for (int i = 0; i < count; ++i) sums[i] = static_cast<std::int16_t>(sums[i] + weight * src[i]);
}

}  // namespace

void ShortSums(const std::uint8_t* const rows[3], int first, int count,
               const std::vector<KernelTap>& taps, std::int16_t* sums) {
  std::fill(sums, sums + count, std::int16_t{0});
  for (const KernelTap& t : taps) AddTap(rows[t.row] + first + t.offset, t.weight, sums, count);
}

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

std::optional<std::vector<KernelTap>> ShortTaps(const Kernel& k) {
  std::int64_t magnitude = 0;
  for (std::int64_t w : k) {
    if (w > 128 || w < -128) return std::nullopt;
    magnitude += w < 0 ? -w : w;
  }
  if (magnitude > 128) return std::nullopt;
  std::vector<KernelTap> taps;
  for (int t = 0; t < 9; ++t)
    if (k[static_cast<std::size_t>(t)] != 0)
      taps.push_back(
          {t / 3, (t % 3 - 1) * 4, static_cast<std::int16_t>(k[static_cast<std::size_t>(t)])});
  return taps;
}

}  // namespace quillane
