// The 3 x 3 kernel sums that realism, abstract and pop art share, worked out a row at a time.
// Pixels are walked as bytes: the neighbours of a colour byte sit 4 bytes to either side and
// one row up or down, and each channel only ever meets itself, so the compiler can treat many
// bytes at once. The alpha bytes get meaningless sums that the callers overwrite.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <vector>

#include "effects/params.h"
#include "imaging/bitmap32.h"

namespace quillane {

// Nine weights k0..k8 in row-major order: k0 k1 k2 the row above, k6 k7 k8 the row below.
// Each is a 32-bit integer, so 64-bit sums of nine weighted bytes never overflow.
using Kernel = std::array<std::int64_t, 9>;

// The kernel windows' one parameter: nine cells Edit1..Edit9 under "You can change the
// figures", starting from defaults (row by row).
ParamSpec KernelParam(EffectParams::Values defaults);

// The nine cells of a kernel parameter; std::invalid_argument when there are not nine or one
// is beyond 32 bits.
Kernel KernelFrom(const EffectParams::Values& values);

// One weighted tap: the byte `offset` bytes across in the row above (0), the same row (1) or
// the row below (2).
struct KernelTap {
  int row = 0;
  int offset = 0;
  std::int16_t weight = 0;
};

// The nonzero taps of a kernel whose every sum over bytes fits 16 bits (the sum of the
// weights' magnitudes at most 128, so |sum| <= 128 * 255); nothing when it is wider.
std::optional<std::vector<KernelTap>> ShortTaps(const Kernel& k);

// sums[i] = sum of the taps over byte first + i of the rows, for i < count.
void ShortSums(const std::uint8_t* const rows[3], int first, int count,
               const std::vector<KernelTap>& taps, std::int16_t* sums);

// A sum limited to 0..255, by value so that the compiler does many at once.
inline std::uint8_t ClampShort(std::int16_t v) {
  const std::int16_t low = v < 0 ? 0 : v;
  return static_cast<std::uint8_t>(low > 255 ? 255 : low);
}

// Bytes of a row handled per round: the sums stay in the first-level cache.
inline constexpr int kSumChunk = 1024;

}  // namespace quillane
