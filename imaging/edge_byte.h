// The line response behind the edge map, for one colour byte of an interior pixel: the plain
// edge pass and the fused pencil pass both build on it, so they cannot drift apart.
#pragma once

#include <algorithm>
#include <cstdint>

namespace quillane {

// 255 minus the clamped larger of the two kernel responses at byte i, whose horizontal
// neighbours sit 4 bytes to either side. Every sum fits 16 bits (the line kernel spans
// -1530..1530), which lets the compiler work on eight bytes per instruction; since the clamp is
// monotonic, max(clamp(a), clamp(b)) is clamp(max(a, b)).
[[gnu::always_inline]] inline std::uint8_t InvertedEdgeByte(const std::uint8_t* __restrict above,
                                                            const std::uint8_t* __restrict row,
                                                            const std::uint8_t* __restrict below,
                                                            int i) {
  const auto left = static_cast<std::int16_t>(above[i - 4] + row[i - 4] + below[i - 4]);
  const auto right = static_cast<std::int16_t>(above[i + 4] + row[i + 4] + below[i + 4]);
  const auto outer =
      static_cast<std::int16_t>(left + right + above[i] + below[i] - row[i - 4] - row[i + 4]);
  const auto a = static_cast<std::int16_t>(6 * row[i] - outer);
  const auto b = static_cast<std::int16_t>(left - right);
  const std::int16_t m = std::max(a, b);
  const std::int16_t clamped = std::min<std::int16_t>(255, std::max<std::int16_t>(0, m));
  return static_cast<std::uint8_t>(255 - clamped);
}

}  // namespace quillane
