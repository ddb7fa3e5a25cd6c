#include "tests/reference/imaging_reference.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdlib>

#include "imaging/numeric.h"

namespace quillane {
namespace {

void CopyColour(Pixel& to, const Pixel& from) {
  to.b = from.b;
  to.g = from.g;
  to.r = from.r;
}

}  // namespace

Bitmap32 InvertedSobelEdgesReference(const Bitmap32& input) {
  const int w = input.Width();
  const int h = input.Height();
  const Bitmap32 snapshot = input;
  Bitmap32 work = input;
  const int lineKernel[3][3] = {{-1, -1, -1}, {0, 6, 0}, {-1, -1, -1}};
  const int gradientKernel[3][3] = {{1, 0, -1}, {1, 0, -1}, {1, 0, -1}};
  std::uint8_t Pixel::*const channels[] = {&Pixel::r, &Pixel::g, &Pixel::b};
  for (int y = 1; y <= h - 2; ++y)
    for (int x = 1; x <= w - 2; ++x)
      for (auto channel : channels) {
        int line = 0;
        int gradient = 0;
        for (int j = -1; j <= 1; ++j)
          for (int i = -1; i <= 1; ++i) {
            const int v = snapshot.At(x + i, y + j).*channel;
            line += lineKernel[j + 1][i + 1] * v;
            gradient += gradientKernel[j + 1][i + 1] * v;
          }
        line = std::clamp(line, 0, 255);
        gradient = std::clamp(gradient, 0, 255);
        work.At(x, y).*channel = static_cast<std::uint8_t>(std::max(line, gradient));
      }
  for (int y = 1; y <= h - 2; ++y) {
    CopyColour(work.At(0, y), work.At(1, y));
    CopyColour(work.At(w - 1, y), work.At(w - 2, y));
  }
  for (int x = 0; x < w; ++x) CopyColour(work.At(x, 0), work.At(x, 1));
  for (int x = 0; x < w; ++x) CopyColour(work.At(x, h - 1), work.At(x, h - 2));
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      Pixel& p = work.At(x, y);
      p.b = static_cast<std::uint8_t>(255 - p.b);
      p.g = static_cast<std::uint8_t>(255 - p.g);
      p.r = static_cast<std::uint8_t>(255 - p.r);
    }
  return work;
}

void GrayRowIntoReference(const Pixel* in, Pixel* out, int width, std::uint32_t set) {
  for (int x = 0; x < width; ++x)
    out[x] =
        std::bit_cast<Pixel>(GrayValue(in[x].r, in[x].g, in[x].b) * 0x010101u | set | 0xFF000000u);
}

Hsl RgbToHslReference(int red, int green, int blue) {
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
  Hsl out{Round(static_cast<Extended>(h) * 360), Round(static_cast<Extended>(s) * 100),
          Round(static_cast<Extended>(l) * 100)};
  if (out.h == 360) out.h = 0;
  return out;
}

Rgb HslToRgbReference(int h, int s, int l) {
  if (h < 0 || h > 359 || s < 0 || s > 100 || l < 0 || l > 100) return Rgb{};
  const auto up = [](int n) { return Round(static_cast<Extended>(n) * 4.25L); };
  const auto down = [](int n) { return Round(255 - static_cast<Extended>(n) * 4.25L); };
  int c[3];
  if (h <= 60) {
    c[0] = 255, c[1] = up(h), c[2] = 0;
  } else if (h <= 120) {
    c[0] = down(h - 60), c[1] = 255, c[2] = 0;
  } else if (h <= 180) {
    c[0] = 0, c[1] = 255, c[2] = up(h - 120);
  } else if (h <= 240) {
    c[0] = 0, c[1] = down(h - 180), c[2] = 255;
  } else if (h <= 300) {
    c[0] = up(h - 240), c[1] = 0, c[2] = 255;
  } else {
    c[0] = 255, c[1] = 0, c[2] = down(h - 300);
  }
  const double f = std::abs(s - 100) / 100.0;
  for (int& x : c) x = Round(x - static_cast<Extended>(x - 128) * f);
  const double t = (l - 50) / 50.0;
  if (t > 0)
    for (int& x : c) x = Round(x + static_cast<Extended>(255 - x) * t);
  else if (t < 0)
    for (int& x : c) x = Round(x + static_cast<Extended>(x) * t);
  return Rgb{c[0], c[1], c[2]};
}

Bitmap32 PencilContrastPassReference(const Bitmap32& input, int c) {
  Bitmap32 out(input.Width(), input.Height());
  for (int y = 0; y < input.Height(); ++y)
    for (int x = 0; x < input.Width(); ++x) {
      const Pixel p = input.At(x, y);
      const Hsl hsl = RgbToHslReference(p.r, p.g, p.b);
      const Rgb e = HslToRgbReference(hsl.h, hsl.s, LightnessContrast(hsl.l, c));
      out.At(x, y) = Pixel{static_cast<std::uint8_t>(e.b), static_cast<std::uint8_t>(e.g),
                           static_cast<std::uint8_t>(e.r), 255};
    }
  return out;
}

}  // namespace quillane
