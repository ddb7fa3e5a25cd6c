// The integer colour model shared by the colour effects, and the tone passes of the pencil
// drawing.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "imaging/bitmap32.h"

namespace quillane {

struct Hsl {
  int h = 0;  // whole degrees 0..359
  int s = 0;  // whole percent 0..100
  int l = 0;  // whole percent 0..100
  friend bool operator==(const Hsl&, const Hsl&) = default;
};

struct Rgb {
  int r = 0;
  int g = 0;
  int b = 0;
  friend bool operator==(const Rgb&, const Rgb&) = default;
};

// RGB to HSL. Fractions are doubles (r = R / 255.0, mx, mn, l = (mx + mn) / 2, d = mx - mn,
// s = d / (mx + mn) below l = 0.5 and d / (2 - mx - mn) from it, h from the largest channel
// with red winning ties over green and green over blue, h / 6, plus 1 when negative). Then
// H = Round(h * 360), S = Round(s * 100), L = Round(l * 100) in extended precision; a hue that
// rounds to 360 is 0.
Hsl RgbToHsl(int r, int g, int b);

// HSL to RGB, not the textbook inverse: a pure hue from straight ramps with the factor 4.25
// (each Round halves to even), blended towards 128 by f = |S - 100| / 100 as
// Round(x - (x - 128) f), then towards white (t > 0: Round(x + (255 - x) t)) or black
// (t < 0: Round(x + x t)) with t = (L - 50) / 50. Inputs outside H 0..359, S 0..100, L 0..100
// give black.
Rgb HslToRgb(int h, int s, int l);

// RGB to HSL of n pixels (their R, G and B), one call for a whole row: the same values as
// RgbToHsl gives.
void RgbToHslRow(const Pixel* in, Hsl* out, int n);

// HSL to RGB as three steps of tables, each channel alone: the pure hue hue[H][c] (c: 0 red,
// 1 green, 2 blue), blended by saturation[S][x], then by lightness[L][x]. For H 0..359 and S, L
// 0..100, HslToRgb gives lightness[L][saturation[S][hue[H][c]]].
struct HslTables {
  std::uint8_t hue[360][3];
  std::uint8_t saturation[101][256];
  std::uint8_t lightness[101][256];
};
const HslTables& HslToRgbTables();

// Hue, saturation and lightness as fractions of 1, in double exactly as the formulas state
// them: what RgbToHsl rounds, and what the freehand brush's colour model works on.
struct HslFractions {
  double h = 0;
  double s = 0;
  double l = 0;
};
HslFractions HslFractionsOf(int red, int green, int blue);

// The lightness contrast curve for L (0..100) and the contrast position c (0..89):
// L1 = L - c + 45, k = tan(c pi / 180); L' = Round(k (L1 - 50)) + 50 for c >= 45 and
// Round(k (L1 - P)) + P with P = 100 - c below; limited to 0..100. Extended precision.
int LightnessContrast(int l, int c);

// All 101 values of the curve for one position.
std::array<std::uint8_t, 101> LightnessContrastTable(int c);

// Every pixel through RGB to HSL, the lightness contrast curve with c, and back; alpha 255.
// The input is not changed.
Bitmap32 PencilContrastPass(const Bitmap32& input, int c);

// What PencilContrastPass makes of each gray level (R = G = B = index): a gray level again.
std::array<std::uint8_t, 256> PencilContrastGrayLevels(int c);

// What PencilLightingPass makes of each gray value: the value plus 2 (v - 128), limited to
// 0..255.
std::array<std::uint8_t, 256> PencilLightingLevels(int v);

// Every pixel becomes its gray value plus 2 (v - 128), limited to 0..255, in B, G and R;
// alpha 255. The input is not changed.
Bitmap32 PencilLightingPass(const Bitmap32& input, int v);

// Writes each pixel's gray value into B, G and R and 255 into alpha.
void ConvertToGray(Bitmap32& bitmap);

// GrayValue of a colour whose weighted sum is an exact half (30 R + 59 G + 11 B ends in 50),
// where only the extended-precision sum's own rounding decides; from a table.
std::uint8_t GrayValueOfHalf(int r, int g, int b);

// What GrayValueOfHalf reads: entry R * 256 + G has bit b / 100 set when the exact half of the
// blue level b rounds up. Padded so that four bytes can be read at any entry.
const std::uint8_t* GrayHalfRoundsUp();

// The gray values (GrayValue) of count pixels, one byte each.
void GrayLevels(const Pixel* in, std::uint8_t* out, int count);

// The same for the first width pixels of one row.
void ConvertRowToGray(Pixel* row, int width);

// A change of every colour through the model: H turned by hueTurn degrees (0..359) round the
// wheel, S and L moved by saturationShift and lightnessShift (-100..100) and limited to 0..100.
struct HslChange {
  int hueTurn = 0;
  int saturationShift = 0;
  int lightnessShift = 0;
};

// The new lightness that a per-pixel level (0..255, from a second picture) gives a colour's L:
// at[level * 101 + L], each 0..100. Padded so that four bytes can be read at any entry.
struct LightnessByLevel {
  std::array<std::uint8_t, 256 * 101 + 3> at{};
};

// Applies a change row by row. Built once per picture (it holds tables of the change).
class HslRowChanger {
 public:
  explicit HslRowChanger(const HslChange& change);

  // For the first width pixels: RGB to HSL; L moved by lightnessShift[x] (when given) and
  // limited to 0..100; H, S and that L through the change; HSL to RGB, alpha 255. in and out
  // may be the same row. Identical to RgbToHsl and HslToRgb pixel by pixel, and faster.
  void Row(const Pixel* in, Pixel* out, int width,
           const std::int16_t* lightnessShift = nullptr) const;

  // The same with L replaced by lightness.at[levels[x] * 101 + L] before the change.
  void RowWithLevels(const Pixel* in, Pixel* out, int width, const std::uint8_t* levels,
                     const LightnessByLevel& lightness) const;

 private:
  HslChange change_;
  // [H * 101 + S]: the pure hue of the changed H blended by the changed S, 0x00RRGGBB.
  std::vector<std::uint32_t> hueSaturation_;
  // [L * 256 + x]: x blended by the changed L, for the plain variant (the AVX2 one computes it).
  std::vector<std::uint8_t> lightRows_;
};

}  // namespace quillane
