// The numeric rules every pixel routine shares. Results must match to the last bit, so
// routines use these helpers and nothing else for rounding, truncation and clamping.
#pragma once

#include <cmath>
#include <cstdint>

namespace quillane {

// Extended precision: the 80-bit x87 format on x86-64. Constants meant for it are written
// with the L suffix (0.3L), so that they are not first rounded to double.
using Extended = long double;

static_assert(sizeof(Extended) > sizeof(double),
              "extended precision must be wider than double for bit-exact results");

// Round to nearest, halves to the even neighbour (2.5 -> 2, 3.5 -> 4), on an extended value.
// The caller forms the value in extended precision; the default rounding mode is never
// changed anywhere in the program.
inline int Round(Extended v) {
  return static_cast<int>(std::nearbyintl(v));
}

// Truncation toward zero.
inline int Trunc(Extended v) {
  return static_cast<int>(v);
}

// Max(0, Min(255, v)) on signed integers.
constexpr int ClampByte(int v) {
  return v < 0 ? 0 : (v > 255 ? 255 : v);
}

// Gray value of a pixel: Round(0.3 R + 0.59 G + 0.11 B) summed in extended precision in the
// order red, green, blue, clamped to a byte.
inline std::uint8_t GrayValue(int r, int g, int b) {
  const Extended sum = 0.3L * r + 0.59L * g + 0.11L * b;
  return static_cast<std::uint8_t>(ClampByte(Round(sum)));
}

// a * b / c without overflow, rounded to the nearest integer with halves away from zero;
// -1 when c is 0, as the platform call this mirrors does.
constexpr int MulDiv(int a, int b, int c) {
  if (c == 0) return -1;
  const std::int64_t num = static_cast<std::int64_t>(a) * b;
  const std::int64_t den = c;
  const bool negative = (num < 0) != (den < 0);
  const std::int64_t an = num < 0 ? -num : num;
  const std::int64_t ad = den < 0 ? -den : den;
  const std::int64_t q = (2 * an + ad) / (2 * ad);
  return static_cast<int>(negative ? -q : q);
}

}  // namespace quillane
