// The colour model of freehand painting: hue, saturation and lightness as fractions 0..1 in
// double precision (the textbook model, not the whole-degree one of the colour effects), and
// the brush colour it gives a drawing's stroke pixel.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

struct FreehandHsl {
  double h = 0;
  double s = 0;
  double l = 0;

  friend bool operator==(const FreehandHsl&, const FreehandHsl&) = default;
};

// The paper a drawing lies on: white, and the tint Thin leaves behind (red 236, green 233,
// blue 216). The brush never recolours them; Thin and Thick treat them as background.
inline constexpr Pixel kPaperWhite{255, 255, 255, 255};
inline constexpr Pixel kPaperTint{216, 233, 236, 255};

// Compares colour bytes only: Thin leaves the tint with alpha 0.
constexpr bool SameColor(Pixel a, Pixel b) {
  return a.r == b.r && a.g == b.g && a.b == b.b;
}
constexpr bool IsPaperColor(Pixel p) {
  return SameColor(p, kPaperWhite) || SameColor(p, kPaperTint);
}

// r, g, b divided by 255; L = (max + min) / 2; S = d / (2 - max - min) when L >= 0.5, else
// d / (max + min), with d = max - min; H from the largest channel (red: (g - b) / d, green:
// 2 + (b - r) / d, blue: 4 + (r - g) / d), divided by 6 and wrapped into 0..1. A gray gives
// H = S = 0.
FreehandHsl RGBtoHSL(Pixel color);

// The inverse, with alpha 255: S = 0 gives gray Round(255 L); otherwise m2 = L (1 + S) for
// L <= 0.5, else L + S - L S, m1 = 2 L - m2, and each channel (red at H + 1/3, green at H, blue
// at H - 1/3) is Round(255 v) of the piecewise-linear hue ramp. Round halves to even.
Pixel HSLtoRGB(double l, double s, double h);

// The brush colour of one stroke pixel: the brush's hue and saturation with the pixel's own
// lightness, raised to at least the brush's, less 0.01 (not below 0).
Pixel BrushColour(Pixel pixel, const FreehandHsl& brush);

}  // namespace quillane
