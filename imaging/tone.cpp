#include "imaging/tone.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstdlib>
#include <cstring>

#include "imaging/hsl_halves.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {

HslFractions HslFractionsOf(int red, int green, int blue) {
  const double r = red / 255.0;
  const double g = green / 255.0;
  const double b = blue / 255.0;
  const double mx = std::max(r, std::max(g, b));
  const double mn = std::min(r, std::min(g, b));
  HslFractions f;
  f.l = (mx + mn) / 2;
  if (mx != mn) {
    const double d = mx - mn;
    f.s = f.l < 0.5 ? d / (mx + mn) : d / (2 - mx - mn);
    if (r == mx)
      f.h = (g - b) / d;
    else if (g == mx)
      f.h = 2 + (b - r) / d;
    else
      f.h = 4 + (r - g) / d;
    f.h = f.h / 6;
    if (f.h < 0) f.h = f.h + 1;
  }
  return f;
}

namespace {

Hsl PlainRgbToHsl(int r, int g, int b) {
  const HslFractions f = HslFractionsOf(r, g, b);
  Hsl out;
  out.h = Round(static_cast<Extended>(f.h) * 360);
  if (out.h == 360) out.h = 0;
  out.s = Round(static_cast<Extended>(f.s) * 100);
  out.l = Round(static_cast<Extended>(f.l) * 100);
  return out;
}

// Round of a value v known to lie strictly between k and k + 1: the same answer as Round,
// without changing the floating-point environment.
int RoundBetween(Extended v, int k) {
  const Extended half = k + 0.5L;
  return v > half ? k + 1 : (v < half ? k : k + (k & 1));
}

// Round(num / den) for whole numbers num >= 0 and den > 0, where the quotient stands for a
// value that the conversion forms in floating point. Away from an exact half the
// floating-point value lies far closer to the true quotient (within 1e-12) than the quotient
// lies to a half (at least 1 / (2 den)), so both round alike. At an exact half the rounding
// errors of the floating-point value decide, so that value is formed and rounded as the
// formula does it.
//
// The quotient is taken by multiplying with a reciprocal: for num < 2^17 and den <= 510,
// (num * ceil(2^32 / den)) >> 32 is floor(num / den) exactly, as the error it adds stays below
// num / 2^32 < 1 / den.
constexpr auto kReciprocals = [] {
  std::array<std::uint64_t, 511> t{};
  for (std::uint64_t d = 1; d < t.size(); ++d) t[d] = ((std::uint64_t{1} << 32) + d - 1) / d;
  return t;
}();

template <typename FloatingValue>
int RoundQuotient(int num, int den, FloatingValue&& floatingValue) {
  const int k = static_cast<int>(
      (static_cast<std::uint64_t>(num) * kReciprocals[static_cast<std::size_t>(den)]) >> 32);
  const int twiceRest = 2 * (num - k * den);
  if (twiceRest != den) return twiceRest < den ? k : k + 1;
  return RoundBetween(floatingValue(), k);
}

// RGB to HSL for channels 0..255 in integer arithmetic, identical to the floating-point
// formulas (checked for every colour in the tests).
inline Hsl FastRgbToHsl(int r, int g, int b) {
  const int mx = std::max(r, std::max(g, b));
  const int mn = std::min(r, std::min(g, b));
  Hsl out;
  // l * 100 = (mx + mn) * 100 / 510 is never an exact half (20 (mx + mn) would have to equal
  // an odd multiple of 51), so it rounds to nearest plainly.
  out.l = ((mx + mn) * 200 + 510) / 1020;
  if (mx == mn) return out;
  const int d = mx - mn;
  // Below l = 0.5 the saturation is d / (mx + mn), from it d / (510 - mx - mn) (in 255ths);
  // at mx + mn = 255 both are the same.
  const int sum = mx + mn;
  out.s = RoundQuotient(100 * d, sum < 255 ? sum : 510 - sum, [&] {
    return static_cast<Extended>(hsl_halves::SaturationFraction(r, g, b)) * 100;
  });
  // Hue in degrees: 60 (g - b) / d, 120 + 60 (b - r) / d or 240 + 60 (r - g) / d by the
  // largest channel (red before green before blue), a negative one taken a turn round. All
  // three are formed and one chosen, which photographs' colours favour over branching.
  const int fromRed = 60 * (g - b) + (g < b ? 360 * d : 0);
  const int fromGreen = 120 * d + 60 * (b - r);
  const int fromBlue = 240 * d + 60 * (r - g);
  const int num = r == mx ? fromRed : (g == mx ? fromGreen : fromBlue);
  out.h = RoundQuotient(
      num, d, [&] { return static_cast<Extended>(hsl_halves::HueFraction(r, g, b)) * 360; });
  if (out.h == 360) out.h = 0;
  return out;
}

// The three steps of HSL to RGB, each exactly as the formula states it.
int PureHueChannel(int h, int channel) {
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
  return c[channel];
}

int SaturationBlend(int x, int s) {
  const double f = std::abs(s - 100) / 100.0;
  return Round(x - static_cast<Extended>(x - 128) * f);
}

int LightnessBlend(int x, int l) {
  const double t = (l - 50) / 50.0;
  if (t > 0) return Round(x + static_cast<Extended>(255 - x) * t);
  if (t < 0) return Round(x + static_cast<Extended>(x) * t);
  return x;
}

const HslTables& Tables() {
  static const HslTables tables = [] {
    HslTables t{};
    for (int h = 0; h < 360; ++h)
      for (int c = 0; c < 3; ++c) t.hue[h][c] = static_cast<std::uint8_t>(PureHueChannel(h, c));
    for (int v = 0; v <= 100; ++v)
      for (int x = 0; x < 256; ++x) {
        t.saturation[v][x] = static_cast<std::uint8_t>(SaturationBlend(x, v));
        t.lightness[v][x] = static_cast<std::uint8_t>(LightnessBlend(x, v));
      }
    return t;
  }();
  return tables;
}

inline Rgb TableHslToRgb(const HslTables& t, int h, int s, int l) {
  const std::uint8_t* hue = t.hue[h];
  const std::uint8_t* sat = t.saturation[s];
  const std::uint8_t* light = t.lightness[l];
  return Rgb{light[sat[hue[0]]], light[sat[hue[1]]], light[sat[hue[2]]]};
}

// Gray values in integers: 100 times the weighted sum is 30 R + 59 G + 11 B exactly. Away from
// an exact half the extended-precision sum (within 1e-15 of it) rounds the same way; at an
// exact half its rounding errors decide. Identical to GrayValue for every colour (checked for
// all of them in the tests).

// For each red and green level, whether an exact half rounds up, for the (at most three) blue
// levels that make one: bit i for the blue level 100 i + (the smallest such level). Filled
// once; every entry compares the extended-precision sum with the half as Round would.
const std::array<std::uint8_t, 65536 + 4>& HalfRoundsUp() {
  static const auto table = [] {
    std::array<std::uint8_t, 65536 + 4> t{};
    for (int r = 0; r < 256; ++r)
      for (int g = 0; g < 256; ++g) {
        // 11 b = 50 - 30 r - 59 g (mod 100), and 91 is the inverse of 11 modulo 100.
        const int first = (((50 - 30 * r - 59 * g) % 100 + 100) * 91) % 100;
        std::uint8_t bits = 0;
        for (int b = first, i = 0; b < 256; b += 100, ++i) {
          const int k = (30 * r + 59 * g + 11 * b) / 100;
          const Extended sum = 0.3L * r + 0.59L * g + 0.11L * b;
          const Extended half = k + 0.5L;
          if (sum > half || (sum == half && (k & 1) != 0))
            bits |= static_cast<std::uint8_t>(1 << i);
        }
        t[static_cast<std::size_t>(r << 8 | g)] = bits;
      }
    return t;
  }();
  return table;
}

// Gray values of n <= kGrayChunk pixels taken as little-endian words 0xAARRGGBB, in 16-bit
// arithmetic so that the compiler can work on several at once; exact halves, which need the
// extended-precision sum, are marked and redone one by one afterwards.
constexpr int kGrayChunk = 128;
void GrayChunk(const std::uint32_t* src, int n, std::uint8_t* level) {
  static_assert(std::endian::native == std::endian::little, "pixels are read as 0xAARRGGBB");
  std::uint8_t half[kGrayChunk];
  std::uint8_t anyHalf = 0;
  for (int i = 0; i < n; ++i) {
    const std::uint32_t p = src[i];
    const auto sum = static_cast<std::uint16_t>(30 * ((p >> 16) & 0xFF) + 59 * ((p >> 8) & 0xFF) +
                                                11 * (p & 0xFF));
    // sum / 100 for every sum up to 25500.
    const auto k = static_cast<std::uint16_t>((static_cast<std::uint32_t>(sum) * 5243u) >> 19);
    const auto rest = static_cast<std::uint16_t>(sum - 100 * k);
    half[i] = rest == 50;
    anyHalf |= half[i];
    level[i] = static_cast<std::uint8_t>(k + (rest > 50));
  }
  if (!anyHalf) return;
  for (int i = 0; i < n; ++i)
    if (half[i])
      level[i] = GrayValueOfHalf((src[i] >> 16) & 0xFF, (src[i] >> 8) & 0xFF, src[i] & 0xFF);
}

// Gray rows: each pixel's gray value plus shift, limited to 0..255, in B, G and R, alpha 255.
// in and out may be the same row.
void GrayRow(const Pixel* in, Pixel* out, int w, int shift) {
  std::uint32_t src[kGrayChunk];
  std::uint32_t dst[kGrayChunk];
  std::uint8_t level[kGrayChunk];
  for (int x0 = 0; x0 < w; x0 += kGrayChunk) {
    const int n = std::min(kGrayChunk, w - x0);
    std::memcpy(src, in + x0, static_cast<std::size_t>(n) * sizeof(Pixel));
    GrayChunk(src, n, level);
    for (int i = 0; i < n; ++i) {
      const int v = std::clamp(level[i] + shift, 0, 255);
      dst[i] = static_cast<std::uint32_t>(v) * 0x010101u | 0xFF000000u;
    }
    std::memcpy(out + x0, dst, static_cast<std::size_t>(n) * sizeof(Pixel));
  }
}

bool IsByte(int v) {
  return (v & ~0xFF) == 0;
}

}  // namespace

const std::uint8_t* GrayHalfRoundsUp() {
  return HalfRoundsUp().data();
}

std::uint8_t GrayValueOfHalf(int r, int g, int b) {
  const int k = (30 * r + 59 * g + 11 * b) / 100;
  const int up = HalfRoundsUp()[static_cast<std::size_t>(r << 8 | g)] >> (b / 100) & 1;
  return static_cast<std::uint8_t>(k + up);
}

Hsl RgbToHsl(int r, int g, int b) {
  if (!IsByte(r) || !IsByte(g) || !IsByte(b)) return PlainRgbToHsl(r, g, b);
  return FastRgbToHsl(r, g, b);
}

const HslTables& HslToRgbTables() {
  return Tables();
}

Rgb HslToRgb(int h, int s, int l) {
  if (h < 0 || h > 359 || s < 0 || s > 100 || l < 0 || l > 100) return Rgb{};
  return TableHslToRgb(Tables(), h, s, l);
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
  for (int l = 0; l <= 100; ++l)
    table[static_cast<std::size_t>(l)] = static_cast<std::uint8_t>(LightnessContrast(l, c));
  return table;
}

Bitmap32 PencilContrastPass(const Bitmap32& input, int c) {
  Bitmap32 out = input;
  const auto curve = LightnessContrastTable(c);
  // A gray pixel keeps hue and saturation 0, so its result depends on its level alone: one
  // table serves every gray pixel, and the edge map this pass usually gets is all gray.
  const std::array<std::uint8_t, 256> grayLevel = PencilContrastGrayLevels(c);
  const HslTables& tables = Tables();
  const int w = out.Width();
  ParallelRows(0, out.Height(), static_cast<std::size_t>(w) * 4, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = out.ScanLine(y);
      for (int x = 0; x < w; ++x) {
        const Pixel p = row[x];
        if (p.r == p.g && p.g == p.b) {
          const std::uint8_t v = grayLevel[p.r];
          row[x] = Pixel{v, v, v, 255};
        } else {
          const Hsl hsl = FastRgbToHsl(p.r, p.g, p.b);
          const Rgb rgb =
              TableHslToRgb(tables, hsl.h, hsl.s, curve[static_cast<std::size_t>(hsl.l)]);
          row[x] = Pixel{static_cast<std::uint8_t>(rgb.b), static_cast<std::uint8_t>(rgb.g),
                         static_cast<std::uint8_t>(rgb.r), 255};
        }
      }
    }
  });
  return out;
}

std::array<std::uint8_t, 256> PencilContrastGrayLevels(int c) {
  const auto curve = LightnessContrastTable(c);
  std::array<std::uint8_t, 256> levels{};
  for (int v = 0; v < 256; ++v) {
    const Hsl hsl = RgbToHsl(v, v, v);
    levels[static_cast<std::size_t>(v)] =
        static_cast<std::uint8_t>(HslToRgb(hsl.h, hsl.s, curve[static_cast<std::size_t>(hsl.l)]).r);
  }
  return levels;
}

std::array<std::uint8_t, 256> PencilLightingLevels(int v) {
  std::array<std::uint8_t, 256> levels{};
  for (int y = 0; y < 256; ++y)
    levels[static_cast<std::size_t>(y)] = static_cast<std::uint8_t>(ClampByte(y + 2 * (v - 128)));
  return levels;
}

Bitmap32 PencilLightingPass(const Bitmap32& input, int v) {
  Bitmap32 out = input;
  const int w = out.Width();
  const int shift = 2 * (v - 128);
  ParallelRows(0, out.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) GrayRow(out.ScanLine(y), out.ScanLine(y), w, shift);
  });
  return out;
}

void ConvertToGray(Bitmap32& bitmap) {
  const int w = bitmap.Width();
  ParallelRows(0, bitmap.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) GrayRow(bitmap.ScanLine(y), bitmap.ScanLine(y), w, 0);
  });
}

void GrayLevels(const Pixel* in, std::uint8_t* out, int count) {
  std::uint32_t src[kGrayChunk];
  for (int x0 = 0; x0 < count; x0 += kGrayChunk) {
    const int n = std::min(kGrayChunk, count - x0);
    std::memcpy(src, in + x0, static_cast<std::size_t>(n) * sizeof(Pixel));
    GrayChunk(src, n, out + x0);
  }
}

void ConvertRowToGray(Pixel* row, int width) {
  GrayRow(row, row, width, 0);
}

}  // namespace quillane
