#include "freehand/color_model.h"

#include <algorithm>

#include "imaging/numeric.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

std::uint8_t Level(double v) {
  return static_cast<std::uint8_t>(ClampByte(Round(255.0L * v)));
}

double Channel(double m1, double m2, double h) {
  if (h < 0)
    h += 1;
  else if (h > 1)
    h -= 1;
  if (6 * h < 1) return m1 + (m2 - m1) * h * 6;
  if (2 * h < 1) return m2;
  if (3 * h < 2) return m1 + (m2 - m1) * (2.0 / 3.0 - h) * 6;
  return m1;
}

}  // namespace

FreehandHsl RGBtoHSL(Pixel color) {
  const HslFractions f = HslFractionsOf(color.r, color.g, color.b);
  return {f.h, f.s, f.l};
}

Pixel HSLtoRGB(double l, double s, double h) {
  if (s == 0) {
    const std::uint8_t gray = Level(l);
    return Pixel{gray, gray, gray, 255};
  }
  const double m2 = l <= 0.5 ? l * (1 + s) : l + s - l * s;
  const double m1 = 2 * l - m2;
  return Pixel{Level(Channel(m1, m2, h - 1.0 / 3.0)), Level(Channel(m1, m2, h)),
               Level(Channel(m1, m2, h + 1.0 / 3.0)), 255};
}

Pixel BrushColour(Pixel pixel, const FreehandHsl& brush) {
  double l = RGBtoHSL(pixel).l;
  if (l < brush.l) l = brush.l;
  l -= 0.01;
  if (l < 0) l = 0;
  return HSLtoRGB(l, brush.s, brush.h);
}

}  // namespace quillane
