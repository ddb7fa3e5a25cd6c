// The 3 x 3 kernel sums that realism, abstract and pop art share, worked out a row at a time.
// Pixels are walked as bytes: the neighbours of a colour byte sit 4 bytes to either side and
// one row up or down, and each channel only ever meets itself, so many bytes are handled at
// once. The alpha bytes get meaningless sums that are replaced by 255.
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

// The second operator abstract and pop art weigh against the kernel:
// sign * (left column - right column), the middle row counting middle times.
struct ColumnGradient {
  int middle = 1;
  int sign = 1;
};

// The interior of one row of a kernel pass. Each colour byte is the kernel's sum over its 3 x 3
// block clamped to 0..255 or, with a gradient, 255 minus the clamped larger of the kernel's and
// the gradient's sums. Alpha is 255. Sums are formed in 16 bits when the weights' magnitudes
// add up to at most 128 (|sum| <= 128 * 255), else in 32 bits; Make gives nothing for kernels
// whose sums could leave 32 bits.
class KernelRowPass {
 public:
  static std::optional<KernelRowPass> Make(const Kernel& k, std::optional<ColumnGradient> gradient);

  // Pixels 1 .. w - 2 of out from the source rows above, row and below, each w >= 3 pixels.
  // The caller ends each band with EndBand, as some stores bypass the caches.
  void Row(const Pixel* above, const Pixel* row, const Pixel* below, int w, Pixel* out) const;
  static void EndBand();

 private:
  struct Tap {
    int row = 0;
    int offset = 0;
    std::int32_t weight = 0;
  };
  void PlainRow(const std::uint8_t* const rows[3], int w, std::uint8_t* out) const;

  std::vector<Tap> taps_;
  std::optional<ColumnGradient> gradient_;
  bool wide_ = false;
  // For the AVX2 variant: the weights in byte pairs (left and right of each row; above and
  // below the centre; the centre alone). Empty when it does not run: no AVX2, sums wider than
  // 16 bits, or a weight of 128, which misses a signed byte.
  std::optional<std::array<std::int8_t, 10>> pairs_;
};

}  // namespace quillane
