// Draws the picture the program shows at start-up (a village by a lake under a late
// afternoon sky) and writes it as a 24-bit bottom-up BMP. It is run by hand when the picture
// is to change; the result is kept in data/startup.bmp and embedded into the program.
//
//   cmake --build <build> --target make_startup_picture
//   <build>/data/make_startup_picture data/startup.bmp [preview.ppm]
//
// Everything is drawn at three times the size and averaged down, so that shapes get smooth
// edges while staying sharp enough for the edge effects to find. The only randomness is a
// fixed-seed hash, so the picture is the same on every machine.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <functional>
#include <iostream>
#include <string>
#include <vector>

#include "imaging/bitmap32.h"

namespace {

using quillane::Bitmap32;
using quillane::Pixel;

constexpr int kWidth = 521;
constexpr int kHeight = 346;
constexpr int kScale = 3;

struct Colour {
  float r = 0, g = 0, b = 0;
};

Colour Mix(Colour a, Colour b, float t) {
  return {a.r + (b.r - a.r) * t, a.g + (b.g - a.g) * t, a.b + (b.b - a.b) * t};
}
Colour Scale(Colour c, float k) {
  return {c.r * k, c.g * k, c.b * k};
}
Colour Add(Colour a, Colour b) {
  return {a.r + b.r, a.g + b.g, a.b + b.b};
}

float Clamp01(float v) {
  return std::clamp(v, 0.0f, 1.0f);
}
float SmoothStep(float e0, float e1, float x) {
  const float t = Clamp01((x - e0) / (e1 - e0));
  return t * t * (3 - 2 * t);
}

// A fixed integer hash: the same numbers everywhere, unlike the standard distributions.
std::uint32_t Hash(std::uint32_t x) {
  x ^= x >> 16;
  x *= 0x7feb352dU;
  x ^= x >> 15;
  x *= 0x846ca68bU;
  x ^= x >> 16;
  return x;
}
float Hash01(std::uint32_t a, std::uint32_t b = 0, std::uint32_t c = 0) {
  return static_cast<float>(Hash(a * 0x9E3779B1U ^ Hash(b + 0x632BE5ABU) ^ Hash(c * 0x85EBCA77U)) >>
                            8) /
         16777216.0f;
}

class Random {
 public:
  explicit Random(std::uint32_t seed) : state_(seed) {}
  float Next() { return Hash01(state_++, 0x5bd1e995U); }
  float Range(float lo, float hi) { return lo + (hi - lo) * Next(); }

 private:
  std::uint32_t state_;
};

// Value noise with smooth interpolation, and its fractal sum.
float ValueNoise(float x, float y, std::uint32_t seed) {
  const float fx = std::floor(x), fy = std::floor(y);
  const auto ix = static_cast<std::int32_t>(fx), iy = static_cast<std::int32_t>(fy);
  const float tx = x - fx, ty = y - fy;
  const float sx = tx * tx * (3 - 2 * tx), sy = ty * ty * (3 - 2 * ty);
  const auto at = [&](std::int32_t i, std::int32_t j) {
    return Hash01(static_cast<std::uint32_t>(i), static_cast<std::uint32_t>(j), seed);
  };
  const float a = at(ix, iy), b = at(ix + 1, iy), c = at(ix, iy + 1), d = at(ix + 1, iy + 1);
  return (a + (b - a) * sx) * (1 - sy) + (c + (d - c) * sx) * sy;
}
float Fbm(float x, float y, std::uint32_t seed, int octaves = 5) {
  float sum = 0, amp = 0.5f, norm = 0;
  for (int i = 0; i < octaves; ++i) {
    sum += amp * ValueNoise(x, y, seed + static_cast<std::uint32_t>(i) * 131U);
    norm += amp;
    amp *= 0.5f;
    x *= 2.03f;
    y *= 2.03f;
  }
  return sum / norm;
}

// The supersampled drawing surface. Shapes are given in picture pixels; each sample sits at
// the centre of its sub-pixel.
class Canvas {
 public:
  Canvas() : w_(kWidth * kScale), h_(kHeight * kScale), px_(static_cast<std::size_t>(w_ * h_)) {}

  int SampleWidth() const { return w_; }
  int SampleHeight() const { return h_; }
  static float ToPicture(int sample) { return (static_cast<float>(sample) + 0.5f) / kScale; }

  Colour& At(int sx, int sy) { return px_[static_cast<std::size_t>(sy * w_ + sx)]; }
  Colour Sample(float x, float y) const {
    const int sx = std::clamp(static_cast<int>(x * kScale), 0, w_ - 1);
    const int sy = std::clamp(static_cast<int>(y * kScale), 0, h_ - 1);
    return px_[static_cast<std::size_t>(sy * w_ + sx)];
  }
  void Blend(int sx, int sy, Colour c, float a) {
    if (sx < 0 || sy < 0 || sx >= w_ || sy >= h_ || a <= 0) return;
    Colour& p = At(sx, sy);
    p = Mix(p, c, Clamp01(a));
  }

  // Calls shade(x, y) for every sample inside the picture-space box; it returns the colour
  // and coverage to blend there.
  template <typename Shade>
  void Region(float x0, float y0, float x1, float y1, Shade&& shade) {
    const int sx0 = std::max(0, static_cast<int>(std::floor(x0 * kScale)));
    const int sy0 = std::max(0, static_cast<int>(std::floor(y0 * kScale)));
    const int sx1 = std::min(w_, static_cast<int>(std::ceil(x1 * kScale)) + 1);
    const int sy1 = std::min(h_, static_cast<int>(std::ceil(y1 * kScale)) + 1);
    for (int sy = sy0; sy < sy1; ++sy)
      for (int sx = sx0; sx < sx1; ++sx) {
        float a = 0;
        const Colour c = shade(ToPicture(sx), ToPicture(sy), a);
        Blend(sx, sy, c, a);
      }
  }

  // Fills a polygon (even-odd rule) with a colour function of the position.
  void Polygon(const std::vector<std::array<float, 2>>& pts,
               const std::function<Colour(float, float)>& colour, float alpha = 1) {
    if (pts.size() < 3) return;
    float minY = pts[0][1], maxY = pts[0][1];
    for (const auto& p : pts) minY = std::min(minY, p[1]), maxY = std::max(maxY, p[1]);
    const int sy0 = std::max(0, static_cast<int>(std::floor(minY * kScale)));
    const int sy1 = std::min(h_ - 1, static_cast<int>(std::ceil(maxY * kScale)));
    std::vector<float> xs;
    for (int sy = sy0; sy <= sy1; ++sy) {
      const float y = ToPicture(sy);
      xs.clear();
      for (std::size_t i = 0; i < pts.size(); ++i) {
        const auto& a = pts[i];
        const auto& b = pts[(i + 1) % pts.size()];
        if ((a[1] <= y && b[1] > y) || (b[1] <= y && a[1] > y))
          xs.push_back(a[0] + (y - a[1]) / (b[1] - a[1]) * (b[0] - a[0]));
      }
      std::sort(xs.begin(), xs.end());
      for (std::size_t i = 0; i + 1 < xs.size(); i += 2) {
        const int sx0 = std::max(0, static_cast<int>(std::ceil(xs[i] * kScale - 0.5f)));
        const int sx1 = std::min(w_ - 1, static_cast<int>(std::floor(xs[i + 1] * kScale - 0.5f)));
        for (int sx = sx0; sx <= sx1; ++sx) Blend(sx, sy, colour(ToPicture(sx), y), alpha);
      }
    }
  }
  void Polygon(const std::vector<std::array<float, 2>>& pts, Colour c, float alpha = 1) {
    Polygon(
        pts, [c](float, float) { return c; }, alpha);
  }

  void Rect(float x0, float y0, float x1, float y1, Colour c, float alpha = 1) {
    Polygon({{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}}, c, alpha);
  }

  void Ellipse(float cx, float cy, float rx, float ry,
               const std::function<Colour(float, float)>& colour, float alpha = 1) {
    Region(cx - rx, cy - ry, cx + rx, cy + ry, [&](float x, float y, float& a) {
      const float dx = (x - cx) / rx, dy = (y - cy) / ry;
      a = dx * dx + dy * dy <= 1 ? alpha : 0;
      return a > 0 ? colour(x, y) : Colour{};
    });
  }

  // A straight stroke of the given width.
  void Line(float x0, float y0, float x1, float y1, float width, Colour c, float alpha = 1) {
    const float dx = x1 - x0, dy = y1 - y0;
    const float len = std::max(1e-4f, std::hypot(dx, dy));
    const float nx = -dy / len * width / 2, ny = dx / len * width / 2;
    Polygon({{x0 + nx, y0 + ny}, {x1 + nx, y1 + ny}, {x1 - nx, y1 - ny}, {x0 - nx, y0 - ny}}, c,
            alpha);
  }

  // Averages the samples down to picture pixels.
  std::vector<Colour> Resolve() const {
    std::vector<Colour> out(static_cast<std::size_t>(kWidth * kHeight));
    const float k = 1.0f / (kScale * kScale);
    for (int y = 0; y < kHeight; ++y)
      for (int x = 0; x < kWidth; ++x) {
        Colour sum;
        for (int j = 0; j < kScale; ++j)
          for (int i = 0; i < kScale; ++i)
            sum = Add(sum, px_[static_cast<std::size_t>((y * kScale + j) * w_ + x * kScale + i)]);
        out[static_cast<std::size_t>(y * kWidth + x)] = Scale(sum, k);
      }
    return out;
  }

 private:
  int w_, h_;
  std::vector<Colour> px_;
};

// ---------------------------------------------------------------------------------------------
// The scene. The sun stands to the upper right, so lit faces look right and shadows fall left.

constexpr float kSunX = 418, kSunY = 62;
constexpr float kWaterLine = 232;  // the lake's far shore
const Colour kSkyTop{58, 104, 178};
const Colour kSkyHorizon{246, 214, 170};
const Colour kHaze{214, 204, 196};

Colour SkyAt(float x, float y) {
  const float t = Clamp01(y / 215.0f);
  Colour c = Mix(kSkyTop, kSkyHorizon, std::pow(t, 1.6f));
  const float d = std::hypot(x - kSunX, (y - kSunY) * 1.15f);
  const float glow = std::exp(-d / 55.0f) * 0.85f + std::exp(-d / 170.0f) * 0.35f;
  c = Mix(c, Colour{255, 236, 190}, Clamp01(glow));
  return c;
}

void DrawSky(Canvas& cv) {
  for (int sy = 0; sy < cv.SampleHeight(); ++sy)
    for (int sx = 0; sx < cv.SampleWidth(); ++sx)
      cv.At(sx, sy) = SkyAt(Canvas::ToPicture(sx), Canvas::ToPicture(sy));
  // Sun disk with a slightly brighter core.
  cv.Ellipse(kSunX, kSunY, 15, 15, [](float x, float y) {
    const float d = std::hypot(x - kSunX, y - kSunY) / 15.0f;
    return Mix(Colour{255, 254, 240}, Colour{255, 236, 170}, d * d);
  });
  // Clouds: stretched fractal noise, lit from the sun's side, thinning towards the horizon.
  cv.Region(0, 0, kWidth, 190, [](float x, float y, float& a) {
    const float n = Fbm(x / 95.0f, y / 24.0f, 11, 6);
    const float band = SmoothStep(10, 60, y) * (1 - SmoothStep(110, 185, y));
    const float density = SmoothStep(0.52f, 0.72f, n) * band;
    const float lit = Fbm((x + 6) / 95.0f, (y - 4) / 24.0f, 11, 6);
    const float shade = Clamp01(0.5f + (n - lit) * 6.0f);
    a = density * 0.92f;
    const float sunNear = std::exp(-std::hypot(x - kSunX, y - kSunY) / 90.0f);
    Colour c = Mix(Colour{255, 250, 242}, Colour{168, 166, 186}, shade);
    return Mix(c, Colour{255, 226, 176}, sunNear * 0.7f);
  });
  // A few birds.
  const std::array<std::array<float, 3>, 6> birds = {{{160, 58, 4.5f},
                                                      {172, 66, 3.5f},
                                                      {151, 70, 3.0f},
                                                      {300, 40, 4.0f},
                                                      {312, 47, 3.0f},
                                                      {226, 96, 2.6f}}};
  for (const auto& b : birds) {
    const Colour ink{44, 40, 48};
    cv.Line(b[0] - b[2], b[1] - b[2] * 0.45f, b[0], b[1], 0.75f, ink);
    cv.Line(b[0], b[1], b[0] + b[2], b[1] - b[2] * 0.5f, 0.75f, ink);
  }
}

// A mountain range whose ridge follows ridged fractal noise; haze blends it towards the sky.
void DrawRange(Canvas& cv, float base, float amplitude, float period, std::uint32_t seed,
               Colour rock, float haze, bool snow) {
  const auto ridgeAt = [&](float x) {
    const float n = Fbm(x / period, 0.5f, seed, 6);
    const float peaks = 1 - std::abs(2 * Fbm(x / (period * 0.6f), 1.5f, seed + 1, 4) - 1);
    return base - amplitude * Clamp01((n - 0.3f) / 0.4f * 0.65f + peaks * 0.45f);
  };
  cv.Region(0, base - amplitude - 2, kWidth, kWaterLine + 2, [&](float x, float y, float& a) {
    const float ridge = ridgeAt(x);
    if (y < ridge) {
      a = 0;
      return Colour{};
    }
    a = 1;
    const float depth = y - ridge;
    // Faces rising towards the sun (on the right) are in shade. Near the crest the ridge's own
    // slope decides; further down, the slope of an ever broader stretch of it, so the flanks
    // form large faces instead of stripes.
    const float span = 1.5f + depth * 0.9f;
    const float slope = (ridgeAt(x + span) - ridgeAt(x - span)) / (2 * span);
    const float rocks = Fbm(x / 5.0f, y / 4.0f, seed + 7, 4) - 0.5f;
    const float light = std::clamp(slope * 1.6f, -0.35f, 0.35f) + rocks * 0.35f;
    Colour c = Scale(rock, 1 + light);
    // Snow above a fixed altitude, reaching further down in the gullies.
    if (snow) {
      const float snowLine = base - amplitude * 0.66f + rocks * 18.0f + slope * 6.0f;
      const float cover = SmoothStep(snowLine + 1.2f, snowLine - 1.2f, y);
      c = Mix(c, Scale(Colour{246, 244, 250}, 1 + std::min(0.0f, light) * 0.6f), 0.9f * cover);
    }
    // Haze thickens towards the foot of the range.
    const float h = Clamp01(haze + SmoothStep(0, 60, depth) * 0.25f);
    return Mix(c, Mix(kHaze, SkyAt(x, y), 0.5f), h);
  });
}

float HillLine(float x) {
  return 196 + 14 * std::sin(x / 70.0f + 1.3f) + 8 * std::sin(x / 31.0f) +
         10 * (Fbm(x / 60.0f, 3.3f, 71, 4) - 0.5f);
}

void DrawHills(Canvas& cv) {
  // Rolling green hills with a patchwork of fields.
  cv.Region(0, 165, kWidth, kHeight, [](float x, float y, float& a) {
    const float top = HillLine(x);
    a = y >= top ? 1 : 0;
    if (a == 0) return Colour{};
    const float depth = y - top;
    const float u = x / 38.0f + std::sin(y / 9.0f) * 0.3f, v = (y - top * 0.6f) / 8.0f;
    const float cell = ValueNoise(std::floor(u) + 0.5f, std::floor(v) + 0.5f, 23);
    Colour field = cell < 0.3f    ? Colour{118, 146, 64}
                   : cell < 0.55f ? Colour{92, 128, 58}
                   : cell < 0.75f ? Colour{170, 160, 84}
                                  : Colour{132, 152, 76};
    // Furrows on the yellow fields, hedges between fields.
    if (cell >= 0.55f && cell < 0.75f) field = Scale(field, 0.93f + 0.07f * std::sin(x * 1.7f + y));
    const float fu = u - std::floor(u), fv = v - std::floor(v);
    if (fu < 0.06f || fv < 0.1f) field = Colour{64, 88, 44};
    field = Scale(field, 0.9f + 0.2f * Fbm(x / 6.0f, y / 3.0f, 29, 3));
    const float haze = 0.35f * (1 - SmoothStep(0, 45, depth));
    return Mix(field, kHaze, haze);
  });
}

// Lake: its colour mirrors what stands above the far shore, broken by ripples.
float ShoreRight(float y) {
  return 200 + (y - kWaterLine) * 1.9f + 14 * std::sin(y / 7.0f);
}

void DrawLake(Canvas& cv) {
  const Canvas mirror = cv;
  cv.Region(0, kWaterLine, 300, 300, [&](float x, float y, float& a) {
    const float depth = y - kWaterLine;
    const float right = ShoreRight(y);
    const float bottom = 296 - 10 * std::sin(x / 40.0f) - 0.08f * x;
    a = (x < right && y < bottom && depth >= 0) ? 1 : 0;
    if (a == 0) return Colour{};
    const float ripple = (Fbm(x / 40.0f, y / 1.6f, 41, 4) - 0.5f) * (2 + depth * 0.25f);
    Colour c = mirror.Sample(x + ripple, kWaterLine - depth * 1.0f - 0.8f);
    c = Mix(c, Colour{40, 78, 112}, 0.28f + depth * 0.006f);
    // Glints where the ripples face the sun.
    const float glint = ValueNoise(x / 3.0f, y * 1.4f, 43);
    if (glint > 0.86f && x > 80) c = Mix(c, Colour{255, 242, 210}, (glint - 0.86f) * 4.5f);
    // A thin bright line along the far shore.
    if (depth < 0.9f) c = Mix(c, Colour{236, 226, 210}, 0.6f);
    return c;
  });
  // Reeds along the near shore.
  Random rnd(5);
  for (int i = 0; i < 150; ++i) {
    const float x = rnd.Range(0, 250);
    const float base = 296 - 10 * std::sin(x / 40.0f) - 0.08f * x + 1.5f;
    const float h = rnd.Range(5, 15);
    const float lean = rnd.Range(-2.5f, 2.5f);
    const Colour c = Mix(Colour{70, 92, 40}, Colour{150, 150, 70}, rnd.Next());
    cv.Line(x, base, x + lean, base - h, 0.6f, c);
  }
}

// A house seen a little from the left: front gable wall, side wall in shade, pitched roof.
struct House {
  float x, base, width, depth, wall;
  Colour wallColour, roofColour;
  bool tower = false;
};

void DrawHouse(Canvas& cv, const House& h, Random& rnd) {
  const float x0 = h.x, x1 = h.x + h.width;  // front (gable) face
  const float top = h.base - h.wall;
  const float side = h.depth;  // side wall runs right and a little up
  const float lift = h.depth * 0.28f;
  const float ridge = top - h.width * 0.55f;
  const Colour lit = h.wallColour;
  const Colour shade = Scale(h.wallColour, 0.66f);
  const auto plaster = [](Colour c) {
    return
        [c](float x, float y) { return Scale(c, 0.94f + 0.1f * Fbm(x / 2.5f, y / 2.5f, 53, 3)); };
  };
  // Side wall (facing the sun: lighter), front gable wall (in shade).
  cv.Polygon({{x1, top}, {x1 + side, top - lift}, {x1 + side, h.base - lift}, {x1, h.base}},
             plaster(lit));
  cv.Polygon({{x0, top}, {x0 + h.width / 2, ridge}, {x1, top}, {x1, h.base}, {x0, h.base}},
             plaster(shade));
  // Roof: the long slope seen from the side, with tile rows.
  const Colour roof = h.roofColour;
  cv.Polygon({{x0 + h.width / 2 - 0.5f, ridge - 0.5f},
              {x0 + h.width / 2 + side, ridge - lift - 0.5f},
              {x1 + side + 1.5f, top - lift + 1},
              {x1 + 1.5f, top + 1}},
             [&](float x, float y) {
               const float rows = std::sin((y - (x - x0) * -lift / side) * 1.9f);
               return Scale(roof, 0.86f + 0.14f * rows + 0.1f * (Fbm(x, y, 61, 2) - 0.5f));
             });
  // Eaves line on the gable.
  cv.Line(x0 - 1, top + 0.6f, x0 + h.width / 2, ridge - 0.5f, 1.2f, Scale(roof, 0.6f));
  cv.Line(x0 + h.width / 2, ridge - 0.5f, x1 + 1.5f, top + 1, 1.2f, Scale(roof, 0.6f));
  // Chimney.
  if (h.width > 14) {
    const float cx = x1 + side * 0.6f, cy = ridge - lift * 0.6f + (top - ridge) * 0.25f;
    cv.Rect(cx, cy - 7, cx + 3, cy + 2, Colour{120, 72, 58});
    cv.Rect(cx - 0.5f, cy - 8, cx + 3.5f, cy - 6.8f, Colour{70, 50, 46});
  }
  // Windows on both walls, a door on the front.
  const Colour glass{46, 52, 66};
  const Colour frame{238, 234, 222};
  const int cols = std::max(1, static_cast<int>(side / 9));
  for (int floor = 0; floor < static_cast<int>(h.wall / 11); ++floor) {
    const float wy = top + 3 + floor * 11;
    for (int i = 0; i < cols; ++i) {
      const float fx = x1 + (i + 0.5f) * side / cols - 2;
      const float fy = wy - (fx - x1) * lift / side;
      const bool lamp = rnd.Next() < 0.18f;
      cv.Polygon({{fx - 0.6f, fy - 0.6f},
                  {fx + 4.6f, fy - 0.6f - 5.2f * lift / side},
                  {fx + 4.6f, fy + 6.6f - 5.2f * lift / side},
                  {fx - 0.6f, fy + 6.6f}},
                 frame);
      cv.Polygon({{fx, fy},
                  {fx + 4, fy - 4 * lift / side},
                  {fx + 4, fy + 6 - 4 * lift / side},
                  {fx, fy + 6}},
                 lamp ? Colour{250, 206, 120} : glass);
      cv.Line(fx + 2, fy - 2 * lift / side, fx + 2, fy + 6 - 2 * lift / side, 0.5f, frame);
    }
  }
  if (h.width >= 12) {
    const float dx = x0 + h.width / 2 - 2.5f;
    cv.Rect(dx, h.base - 9, dx + 5, h.base, Colour{92, 58, 40});
    cv.Rect(dx + 0.7f, h.base - 8.3f, dx + 4.3f, h.base, Colour{120, 78, 52});
  }
  if (h.width >= 12 && h.wall > 14) {
    const float wx = x0 + h.width / 2 - 2;
    cv.Rect(wx - 0.6f, top - 1.6f, wx + 4.6f, top + 5.6f, frame);
    cv.Rect(wx, top - 1, wx + 4, top + 5, glass);
  }
}

void DrawChurch(Canvas& cv, float x, float base) {
  const Colour stone{214, 206, 186};
  const Colour shade = Scale(stone, 0.68f);
  // Nave.
  Random rnd(99);
  DrawHouse(cv, House{x + 10, base, 18, 30, 16, Colour{222, 214, 196}, Colour{110, 70, 62}}, rnd);
  // Tower with a spire, standing in front.
  const float tx0 = x - 4, tx1 = x + 10, top = base - 46;
  cv.Polygon(
      {{tx1, top}, {tx1 + 5, top - 1.5f}, {tx1 + 5, base - 1.5f}, {tx1, base}},
      [&](float px, float py) { return Scale(stone, 0.95f + 0.1f * Fbm(px / 2, py / 2, 57, 3)); });
  cv.Rect(tx0, top, tx1, base, shade);
  // Stone courses.
  for (float y = top + 4; y < base; y += 4) cv.Line(tx0, y, tx1, y, 0.35f, Scale(shade, 0.85f));
  // Belfry openings and a clock.
  cv.Rect(tx0 + 3, top + 4, tx0 + 6, top + 11, Colour{30, 30, 36});
  cv.Rect(tx0 + 8, top + 4, tx0 + 11, top + 11, Colour{30, 30, 36});
  cv.Ellipse(x + 3, top + 18, 3.2f, 3.2f, [](float, float) { return Colour{246, 240, 220}; });
  cv.Line(x + 3, top + 18, x + 3, top + 15.8f, 0.5f, Colour{20, 20, 20});
  cv.Line(x + 3, top + 18, x + 4.6f, top + 18.6f, 0.5f, Colour{20, 20, 20});
  cv.Polygon({{tx0 - 1, top}, {x + 3, top - 28}, {tx1 + 1, top}}, Colour{70, 84, 96});
  cv.Polygon({{x + 3, top - 28}, {tx1 + 6, top - 1.5f}, {tx1 + 1, top}}, Colour{112, 130, 140});
  cv.Line(x + 3, top - 28, x + 3, top - 36, 0.7f, Colour{60, 50, 40});
  cv.Line(x + 0.8f, top - 33, x + 5.2f, top - 33, 0.7f, Colour{60, 50, 40});
}

// A broad-leaved tree: a crown of many lit leaf clusters on a trunk.
void DrawTree(Canvas& cv, float x, float base, float size, std::uint32_t seed) {
  Random rnd(seed);
  const Colour trunk{74, 56, 42};
  cv.Line(x, base, x + size * 0.04f, base - size * 0.9f, size * 0.12f, trunk);
  cv.Line(x, base - size * 0.55f, x - size * 0.25f, base - size * 0.95f, size * 0.05f, trunk);
  cv.Line(x, base - size * 0.6f, x + size * 0.3f, base - size * 1.0f, size * 0.05f, trunk);
  const float cx = x, cy = base - size * 1.05f;
  const float rx = size * 0.55f, ry = size * 0.5f;
  const Colour dark{34, 56, 28}, mid{84, 118, 48}, light{178, 192, 88};
  // Leaves: a fine speckle of light and dark flecks, so the crown has texture up close.
  const auto leaves = [seed](Colour c, float px, float py) {
    const float fleck = ValueNoise(px * 2.7f, py * 2.7f, seed + 5);
    return Scale(c, fleck > 0.72f ? 1.25f : (fleck < 0.25f ? 0.7f : 0.85f + 0.3f * fleck));
  };
  // An irregular shadow mass of overlapping clumps, then clumps lit from the upper right.
  for (int i = 0; i < static_cast<int>(size * 1.6f); ++i) {
    const float ang = rnd.Range(0, 6.2832f), rad = std::sqrt(rnd.Next());
    const float bx = cx + std::cos(ang) * rad * rx * 0.8f;
    const float by = cy + std::sin(ang) * rad * ry * 0.8f;
    const float br = size * rnd.Range(0.14f, 0.24f);
    cv.Ellipse(bx, by, br, br * 0.85f, [&](float px, float py) { return leaves(dark, px, py); });
  }
  const int clusters = static_cast<int>(size * 3.5f);
  for (int i = 0; i < clusters; ++i) {
    const float ang = rnd.Range(0, 6.2832f), rad = std::sqrt(rnd.Next());
    const float bx = cx + std::cos(ang) * rad * rx * 0.85f + size * 0.03f;
    const float by = cy + std::sin(ang) * rad * ry * 0.85f - size * 0.03f;
    const float br = size * rnd.Range(0.07f, 0.15f);
    const float sideLight = Clamp01(0.45f + 0.6f * ((bx - cx) / rx - (by - cy) / ry) * 0.5f);
    cv.Ellipse(bx, by, br, br * 0.85f, [&](float px, float py) {
      const float nx = (px - bx) / br, ny = (py - by) / br;
      const float toward = Clamp01(0.5f + 0.5f * (nx * 0.7f - ny * 0.7f));
      const Colour c = Mix(Mix(dark, mid, toward * (0.4f + 0.6f * sideLight)), light,
                           toward * toward * sideLight * sideLight);
      return leaves(c, px, py);
    });
  }
}

// A conifer: stacked tiers of needles.
void DrawConifer(Canvas& cv, float x, float base, float height, std::uint32_t seed) {
  Random rnd(seed);
  cv.Line(x, base, x, base - height * 0.2f, height * 0.06f, Colour{70, 50, 38});
  const int tiers = 5;
  for (int i = 0; i < tiers; ++i) {
    const float t = static_cast<float>(i) / tiers;
    const float ty = base - height * (0.12f + 0.88f * t);
    const float half = height * 0.24f * (1 - t * 0.8f);
    const float top = ty - height * 0.3f;
    cv.Polygon({{x - half, ty}, {x, top}, {x + half, ty - half * 0.1f}}, [&](float px, float py) {
      const float lit = px > x ? 1.25f : 0.85f;
      const float needle = 0.75f + 0.5f * ValueNoise(px * 2.2f, py * 0.9f, seed);
      return Scale(Colour{34, 64, 40}, lit * needle);
    });
  }
  (void)rnd;
}

float RoadCentre(float y) {
  const float t = (y - 226) / (kHeight - 226);  // 0 at the village, 1 at the bottom edge
  return 338 - 40 * t + 36 * std::sin(t * 3.4f);
}
float RoadHalfWidth(float y) {
  return 2.5f + (y - 226) * 0.32f;
}

void DrawRoad(Canvas& cv) {
  cv.Region(200, 224, kWidth, kHeight, [](float x, float y, float& a) {
    if (y < 226) {
      a = 0;
      return Colour{};
    }
    const float d = std::abs(x - RoadCentre(y)) / RoadHalfWidth(y);
    a = d <= 1 ? 1 : 0;
    const float rut = std::abs(std::abs(x - RoadCentre(y)) / RoadHalfWidth(y) - 0.45f);
    Colour c = Mix(Colour{196, 170, 126}, Colour{160, 134, 98}, Fbm(x / 3.0f, y / 1.5f, 81, 4));
    if (rut < 0.08f) c = Scale(c, 0.82f);
    if (d > 0.9f) c = Mix(c, Colour{110, 120, 60}, 0.6f);  // grass at the verges
    // Pebbles.
    const float p = ValueNoise(x * 1.3f, y * 1.3f, 83);
    if (p > 0.9f) c = Mix(c, Colour{232, 220, 200}, 0.6f);
    return c;
  });
  // A wooden fence along the left side of the road.
  float lastX = 0, lastTop = 0;
  bool first = true;
  for (float y = 236; y < kHeight + 12; y += 4 + (y - 226) * 0.16f) {
    const float x = RoadCentre(y) - RoadHalfWidth(y) - 3 - (y - 226) * 0.03f;
    const float h = 3 + (y - 226) * 0.17f;
    const float wdt = 0.7f + (y - 226) * 0.025f;
    const Colour wood{98, 74, 52};
    cv.Rect(x - wdt / 2, y - h, x + wdt / 2, y, wood);
    cv.Rect(x - wdt / 2 + wdt * 0.55f, y - h, x + wdt / 2, y, Scale(wood, 1.35f));
    if (!first) {
      cv.Line(lastX, lastTop + h * 0.15f, x, y - h * 0.85f, wdt * 0.45f, Colour{126, 98, 70});
      cv.Line(lastX, lastTop + h * 0.55f, x, y - h * 0.45f, wdt * 0.45f, Colour{126, 98, 70});
    }
    lastX = x;
    lastTop = y - h;
    first = false;
  }
}

// Near grass with blades and a scatter of flowers.
void DrawMeadow(Canvas& cv) {
  Random rnd(17);
  for (int i = 0; i < 5200; ++i) {
    const float y = 262 + std::pow(rnd.Next(), 0.7f) * (kHeight - 258);
    const float x = rnd.Range(-4, kWidth + 4);
    const float rc = RoadCentre(y), rw = RoadHalfWidth(y);
    if (std::abs(x - rc) < rw * 0.95f) continue;
    if (x < ShoreRight(y) + 6 && y < 300 - 0.08f * x) continue;  // lake
    const float h = (1.5f + (y - 258) * 0.09f) * rnd.Range(0.6f, 1.3f);
    const float lean = rnd.Range(-0.5f, 0.5f) * h;
    const float tone = rnd.Next();
    const Colour c = tone < 0.5f ? Mix(Colour{52, 84, 30}, Colour{96, 132, 46}, tone * 2)
                     : tone < 0.9f
                         ? Mix(Colour{96, 132, 46}, Colour{156, 170, 74}, (tone - 0.5f) * 2.5f)
                         : Colour{182, 178, 96};
    cv.Line(x, y, x + lean, y - h, 0.35f + (y - 258) * 0.008f, c);
  }
  for (int i = 0; i < 220; ++i) {
    const float y = rnd.Range(276, kHeight);
    const float x = rnd.Range(0, kWidth);
    if (std::abs(x - RoadCentre(y)) < RoadHalfWidth(y) + 2) continue;
    if (x < ShoreRight(y) + 6 && y < 300 - 0.08f * x) continue;
    const float r = 0.6f + (y - 276) * 0.018f;
    const float pick = rnd.Next();
    const Colour c = pick < 0.4f    ? Colour{236, 226, 232}
                     : pick < 0.75f ? Colour{246, 206, 60}
                                    : Colour{206, 46, 50};
    cv.Ellipse(x, y, r, r * 0.8f, [c](float, float) { return c; });
    cv.Ellipse(x, y, r * 0.35f, r * 0.3f, [](float, float) { return Colour{120, 90, 30}; });
  }
}

void DrawForeground(Canvas& cv) {
  // Ground under the meadow, darker towards the bottom edge.
  cv.Region(0, 250, kWidth, kHeight, [](float x, float y, float& a) {
    const float lakeBottom = 296 - 10 * std::sin(x / 40.0f) - 0.08f * x;
    const bool lake = x < ShoreRight(y) && y < lakeBottom;
    const float edge = 258 + 6 * std::sin(x / 50.0f);
    a = (!lake && y > edge) ? SmoothStep(edge, edge + 8, y) : 0;
    const float n = Fbm(x / 20.0f, y / 8.0f, 91, 5);
    return Mix(Colour{104, 136, 52}, Colour{48, 76, 30}, Clamp01(n * 0.7f + (y - 258) / 160));
  });
}

void Draw(Canvas& cv) {
  DrawSky(cv);
  DrawRange(cv, 172, 78, 90, 3, Colour{104, 112, 144}, 0.42f, true);
  DrawRange(cv, 194, 44, 64, 5, Colour{76, 96, 106}, 0.36f, false);
  DrawRange(cv, 212, 30, 42, 9, Colour{62, 88, 70}, 0.28f, false);
  DrawHills(cv);
  // Distant tree lines along the hills.
  for (int i = 0; i < 60; ++i) {
    const float x = 6 + i * 8.6f + 3 * std::sin(i * 1.7f);
    const float y = HillLine(x) + 2;
    DrawConifer(cv, x, y + 1, 7 + 4 * Hash01(static_cast<std::uint32_t>(i), 7), 200 + i);
  }
  // Bushes and small trees along the far shore, so the lake has something to mirror.
  Random shore(77);
  for (float x = -4; x < 214; x += shore.Range(4, 9)) {
    const float size = shore.Range(4, 9);
    DrawTree(cv, x, kWaterLine + 0.5f, size, 600 + static_cast<std::uint32_t>(x + 10));
  }
  DrawLake(cv);
  // The village on the slope to the right of the road.
  Random rnd(31);
  const std::array<House, 9> houses = {{
      {262, 232, 14, 20, 12, {232, 222, 196}, {168, 74, 52}},
      {398, 226, 16, 24, 16, {236, 230, 214}, {150, 66, 50}},
      {432, 231, 13, 20, 12, {218, 190, 140}, {126, 70, 58}},
      {290, 240, 18, 28, 17, {226, 206, 160}, {176, 82, 56}},
      {360, 246, 20, 30, 20, {240, 236, 226}, {162, 70, 50}},
      {458, 244, 18, 26, 16, {224, 214, 190}, {140, 60, 46}},
      {226, 250, 16, 22, 14, {216, 200, 170}, {170, 90, 60}},
      {404, 260, 22, 34, 22, {232, 220, 192}, {158, 68, 48}},
      {480, 268, 20, 30, 20, {238, 226, 200}, {150, 74, 52}},
  }};
  DrawTree(cv, 252, 236, 18, 401);
  DrawChurch(cv, 340, 236);
  DrawTree(cv, 384, 238, 16, 402);
  for (int i = 0; i < 3; ++i) DrawHouse(cv, houses[static_cast<std::size_t>(i)], rnd);
  DrawTree(cv, 472, 242, 20, 403);
  DrawTree(cv, 328, 246, 15, 404);
  for (int i = 3; i < 7; ++i) DrawHouse(cv, houses[static_cast<std::size_t>(i)], rnd);
  DrawForeground(cv);
  DrawRoad(cv);
  for (int i = 7; i < 9; ++i) DrawHouse(cv, houses[static_cast<std::size_t>(i)], rnd);
  DrawConifer(cv, 214, 262, 40, 501);
  DrawConifer(cv, 200, 258, 30, 502);
  DrawMeadow(cv);
  // Large trees framing the left and right of the picture.
  DrawTree(cv, 60, 318, 62, 405);
  DrawTree(cv, 112, 302, 36, 406);
  DrawTree(cv, 506, 330, 52, 407);
}

Bitmap32 Render() {
  Canvas cv;
  Draw(cv);
  const std::vector<Colour> px = cv.Resolve();
  Bitmap32 out(kWidth, kHeight);
  for (int y = 0; y < kHeight; ++y) {
    Pixel* row = out.ScanLine(y);
    for (int x = 0; x < kWidth; ++x) {
      Colour c = px[static_cast<std::size_t>(y * kWidth + x)];
      // A soft vignette and a little grain, as a photograph would have.
      const float dx = (x - kWidth / 2.0f) / kWidth, dy = (y - kHeight / 2.0f) / kHeight;
      c = Scale(c, 1 - 0.22f * (dx * dx + dy * dy) * 2);
      const auto grain = [&](std::uint32_t ch) {
        return (Hash01(static_cast<std::uint32_t>(x), static_cast<std::uint32_t>(y), 1000 + ch) +
                Hash01(static_cast<std::uint32_t>(x), static_cast<std::uint32_t>(y), 2000 + ch) -
                1.0f) *
               5.0f;
      };
      const auto byte = [](float v) {
        return static_cast<std::uint8_t>(std::clamp(static_cast<int>(std::lround(v)), 0, 255));
      };
      const float common = grain(0);
      row[x] = Pixel{byte(c.b + common + grain(3) * 0.4f), byte(c.g + common + grain(2) * 0.4f),
                     byte(c.r + common + grain(1) * 0.4f), 255};
    }
  }
  return out;
}

void PutLe(std::vector<std::uint8_t>& out, std::uint32_t v, int bytes) {
  for (int i = 0; i < bytes; ++i) out.push_back(static_cast<std::uint8_t>(v >> (8 * i)));
}

// A 24-bit bottom-up BMP with the usual 40-byte header, rows padded to four bytes.
std::vector<std::uint8_t> EncodeBmp24(const Bitmap32& b) {
  const std::uint32_t stride = (static_cast<std::uint32_t>(b.Width()) * 3 + 3) & ~3U;
  const std::uint32_t imageSize = stride * static_cast<std::uint32_t>(b.Height());
  std::vector<std::uint8_t> out;
  out.push_back('B');
  out.push_back('M');
  PutLe(out, 54 + imageSize, 4);
  PutLe(out, 0, 4);
  PutLe(out, 54, 4);
  PutLe(out, 40, 4);
  PutLe(out, static_cast<std::uint32_t>(b.Width()), 4);
  PutLe(out, static_cast<std::uint32_t>(b.Height()), 4);
  PutLe(out, 1, 2);
  PutLe(out, 24, 2);
  PutLe(out, 0, 4);  // no compression
  PutLe(out, imageSize, 4);
  PutLe(out, 2835, 4);  // 72 dots per inch
  PutLe(out, 2835, 4);
  PutLe(out, 0, 4);
  PutLe(out, 0, 4);
  for (int y = b.Height() - 1; y >= 0; --y) {
    const Pixel* row = b.ScanLine(y);
    for (int x = 0; x < b.Width(); ++x) {
      out.push_back(row[x].b);
      out.push_back(row[x].g);
      out.push_back(row[x].r);
    }
    for (std::uint32_t i = static_cast<std::uint32_t>(b.Width()) * 3; i < stride; ++i)
      out.push_back(0);
  }
  return out;
}

bool WriteFile(const std::string& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream f(path, std::ios::binary);
  f.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  return static_cast<bool>(f);
}

std::vector<std::uint8_t> EncodePpm(const Bitmap32& b) {
  const std::string head =
      "P6\n" + std::to_string(b.Width()) + " " + std::to_string(b.Height()) + "\n255\n";
  std::vector<std::uint8_t> out(head.begin(), head.end());
  for (int y = 0; y < b.Height(); ++y)
    for (int x = 0; x < b.Width(); ++x) {
      const Pixel p = b.ScanLine(y)[x];
      out.push_back(p.r);
      out.push_back(p.g);
      out.push_back(p.b);
    }
  return out;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 2 || argc > 3) {
    std::cerr << "usage: make_startup_picture <out.bmp> [preview.ppm]\n";
    return 2;
  }
  const Bitmap32 picture = Render();
  if (!WriteFile(argv[1], EncodeBmp24(picture))) {
    std::cerr << "cannot write " << argv[1] << "\n";
    return 1;
  }
  if (argc == 3 && !WriteFile(argv[2], EncodePpm(picture))) {
    std::cerr << "cannot write " << argv[2] << "\n";
    return 1;
  }
  return 0;
}
