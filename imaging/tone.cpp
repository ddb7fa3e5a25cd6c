#include "imaging/tone.h"

#include <cmath>
#include <cstdlib>

#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {

Hsl RgbToHsl(int red, int green, int blue) {
  const double r = red / 255.0;
  const double g = green / 255.0;
  const double b = blue / 255.0;
  const double mx = std::max(r, std::max(g, b));
  const double mn = std::min(r, std::min(g, b));
  const double l = (mx + mn) / 2;
  double h = 0;
  double s = 0;
  if (mx != mn) {
    const double d = mx - mn;
    s = l < 0.5 ? d / (mx + mn) : d / (2 - mx - mn);
    if (r == mx)
      h = (g - b) / d;
    else if (g == mx)
      h = 2 + (b - r) / d;
    else
      h = 4 + (r - g) / d;
    h = h / 6;
    if (h < 0) h = h + 1;
  }
  Hsl out;
  out.h = Round(static_cast<Extended>(h) * 360);
  if (out.h == 360) out.h = 0;
  out.s = Round(static_cast<Extended>(s) * 100);
  out.l = Round(static_cast<Extended>(l) * 100);
  return out;
}

Rgb HslToRgb(int h, int s, int l) {
  if (h < 0 || h > 359 || s < 0 || s > 100 || l < 0 || l > 100) return Rgb{};
  // Every ramp value H * 4.25 is exact in binary, so these rounds see true halves.
  const auto ramp = [](int steps) { return Round(static_cast<Extended>(steps) * 4.25L); };
  const auto down = [](int steps) { return Round(255 - static_cast<Extended>(steps) * 4.25L); };
  int c[3];  // r, g, b
  if (h <= 60) {
    c[0] = 255, c[1] = ramp(h), c[2] = 0;
  } else if (h <= 120) {
    c[0] = down(h - 60), c[1] = 255, c[2] = 0;
  } else if (h <= 180) {
    c[0] = 0, c[1] = 255, c[2] = ramp(h - 120);
  } else if (h <= 240) {
    c[0] = 0, c[1] = down(h - 180), c[2] = 255;
  } else if (h <= 300) {
    c[0] = ramp(h - 240), c[1] = 0, c[2] = 255;
  } else {
    c[0] = 255, c[1] = 0, c[2] = down(h - 300);
  }
  const double f = std::abs(s - 100) / 100.0;
  for (int& x : c) x = Round(x - static_cast<Extended>(x - 128) * f);
  const double t = (l - 50) / 50.0;
  if (t > 0) {
    for (int& x : c) x = Round(x + static_cast<Extended>(255 - x) * t);
  } else if (t < 0) {
    for (int& x : c) x = Round(x + static_cast<Extended>(x) * t);
  }
  return Rgb{c[0], c[1], c[2]};
}

int LightnessContrast(int l, int c) {
  const Extended pi = 3.14159265358979323846264338327950288L;
  const int l1 = l - c + 45;
  const Extended k = std::tan(static_cast<Extended>(c) * pi / 180);
  int out;
  if (c >= 45) {
    out = Round(k * (l1 - 50)) + 50;
  } else {
    const int p = 100 - c;
    out = Round(k * (l1 - p)) + p;
  }
  return out < 0 ? 0 : (out > 100 ? 100 : out);
}

std::array<std::uint8_t, 101> LightnessContrastTable(int c) {
  std::array<std::uint8_t, 101> table{};
  for (int l = 0; l <= 100; ++l) table[static_cast<std::size_t>(l)] =
      static_cast<std::uint8_t>(LightnessContrast(l, c));
  return table;
}

TBitmap32 PencilContrastPass(const TBitmap32& input, int c) {
  TBitmap32 out = input;
  const auto curve = LightnessContrastTable(c);
  // A gray pixel keeps hue and saturation 0, so its result depends on its level alone: one
  // table serves every gray pixel, and the edge map this pass usually gets is all gray.
  std::array<std::uint8_t, 256> grayLevel{};
  for (int v = 0; v < 256; ++v) {
    const Hsl hsl = RgbToHsl(v, v, v);
    grayLevel[static_cast<std::size_t>(v)] = static_cast<std::uint8_t>(
        HslToRgb(hsl.h, hsl.s, curve[static_cast<std::size_t>(hsl.l)]).r);
  }
  const int w = out.Width();
  ParallelRows(0, out.Height(), static_cast<std::size_t>(w) * 4, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = out.ScanLine(y);
      for (int x = 0; x < w; ++x) {
        Pixel& p = row[x];
        if (p.r == p.g && p.g == p.b) {
          const std::uint8_t v = grayLevel[p.r];
          p.b = p.g = p.r = v;
        } else {
          const Hsl hsl = RgbToHsl(p.r, p.g, p.b);
          const Rgb rgb = HslToRgb(hsl.h, hsl.s, curve[static_cast<std::size_t>(hsl.l)]);
          p.r = static_cast<std::uint8_t>(rgb.r);
          p.g = static_cast<std::uint8_t>(rgb.g);
          p.b = static_cast<std::uint8_t>(rgb.b);
        }
        p.a = 255;
      }
    }
  });
  return out;
}

TBitmap32 PencilLightingPass(const TBitmap32& input, int v) {
  TBitmap32 out = input;
  const int shift = 2 * (v - 128);
  Pixel* p = out.Data();
  const std::size_t n = out.PixelCount();
  for (std::size_t i = 0; i < n; ++i) {
    const std::uint8_t y = static_cast<std::uint8_t>(ClampByte(GrayValue(p[i].r, p[i].g, p[i].b) + shift));
    p[i] = Pixel{y, y, y, 255};
  }
  return out;
}

void ConvertToGray(TBitmap32& bitmap) {
  const int w = bitmap.Width();
  ParallelRows(0, bitmap.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = bitmap.ScanLine(y);
      for (int x = 0; x < w; ++x) {
        const std::uint8_t g = GrayValue(row[x].r, row[x].g, row[x].b);
        row[x] = Pixel{g, g, g, 255};
      }
    }
  });
}

}  // namespace quillane
