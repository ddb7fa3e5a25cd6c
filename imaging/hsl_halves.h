// The floating-point side of RGB to HSL. The integer conversions decide every colour whose
// exact hue or saturation is not a half; at a half only the rounding errors of the
// floating-point formulas decide, so those colours go through them.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>

#include "imaging/numeric.h"

namespace quillane::hsl_halves {

// v / 255 for every channel value, as the formulas form it: a constant expression divides
// exactly as the processor does.
inline constexpr auto kFractions = [] {
  std::array<double, 256> f{};
  for (int v = 0; v < 256; ++v) f[static_cast<std::size_t>(v)] = v / 255.0;
  return f;
}();

// The saturation fraction s of a colour that is not gray.
inline double SaturationFraction(int red, int green, int blue) {
  const double mx = kFractions[static_cast<std::size_t>(std::max(red, std::max(green, blue)))];
  const double mn = kFractions[static_cast<std::size_t>(std::min(red, std::min(green, blue)))];
  return (mx + mn) / 2 < 0.5 ? (mx - mn) / (mx + mn) : (mx - mn) / (2 - mx - mn);
}

// The hue fraction h (0..1) of a colour that is not gray.
inline double HueFraction(int red, int green, int blue) {
  const double r = kFractions[static_cast<std::size_t>(red)];
  const double g = kFractions[static_cast<std::size_t>(green)];
  const double b = kFractions[static_cast<std::size_t>(blue)];
  const double mx = std::max(r, std::max(g, b));
  const double d = mx - std::min(r, std::min(g, b));
  double h = r == mx ? (g - b) / d : (g == mx ? 2 + (b - r) / d : 4 + (r - g) / d);
  h = h / 6;
  return h < 0 ? h + 1 : h;
}

// Round for 0 <= v < 2^31, without calling into the floating-point environment: removing the
// whole part of an extended value is exact.
inline int RoundNonNegative(Extended v) {
  const int k = static_cast<int>(v);
  const Extended rest = v - k;
  return rest > 0.5L ? k + 1 : (rest < 0.5L ? k : k + (k & 1));
}

// H * 101 + S of a colour that is not gray, straight from the floating-point formulas.
inline int FloatingHueSaturation(int red, int green, int blue) {
  int h = RoundNonNegative(static_cast<Extended>(HueFraction(red, green, blue)) * 360);
  h = h == 360 ? 0 : h;
  return h * 101 +
         RoundNonNegative(static_cast<Extended>(SaturationFraction(red, green, blue)) * 100);
}

}  // namespace quillane::hsl_halves
