// Draws the fifteen 58 x 58 gray surface tiles of the Texture effect and writes them as
// <folder>/1.bmp .. 15.bmp (tile 5 with 8 bits per pixel and a gray palette, the others 24-bit
// bottom-up). Run by hand when a tile is to change; the results are kept in data/textures/.
//
//   cmake --build <build> --target make_texture_tiles
//   <build>/data/make_texture_tiles data/textures
//
// The tiles repeat across the picture, so every pattern is built from waves with a whole
// number of cycles per 58 pixels and from lattices that wrap at the tile's edge: the tile is
// seamless by construction. Each pattern is then bent by a power curve found by bisection so
// that its lightness has the minimum, maximum and mean the effect's table gives. The only
// randomness is a fixed-seed hash, so the tiles are the same on every machine.
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

namespace {

constexpr int kSize = 58;
constexpr double kPi = 3.14159265358979323846;

struct Target {
  int min;
  double mean;
  int max;
};
// Lightness in percent, tile 1 first.
constexpr std::array<Target, 15> kTargets{{{9, 68.3, 100},
                                           {24, 67.9, 100},
                                           {20, 63.3, 91},
                                           {12, 67.2, 100},
                                           {0, 56.9, 100},
                                           {0, 64.3, 95},
                                           {0, 68.2, 97},
                                           {5, 62.3, 93},
                                           {0, 69.4, 100},
                                           {5, 66.9, 99},
                                           {19, 55.9, 99},
                                           {23, 58.8, 100},
                                           {38, 68.5, 93},
                                           {23, 49.2, 77},
                                           {32, 46.5, 90}}};

std::uint32_t Hash(std::uint32_t x) {
  x ^= x >> 16;
  x *= 0x7feb352dU;
  x ^= x >> 15;
  x *= 0x846ca68bU;
  x ^= x >> 16;
  return x;
}
double Unit(std::uint32_t a, std::uint32_t b, std::uint32_t seed) {
  return Hash(a * 0x9E3779B1U ^ Hash(b * 0x85EBCA77U ^ Hash(seed))) / 4294967295.0;
}
int Wrap(int v, int n) {
  return ((v % n) + n) % n;
}
double Smooth(double t) {
  return t * t * (3 - 2 * t);
}

// Value noise on a kx by ky lattice stretched over the tile and wrapping at its edges.
double Noise(double x, double y, int kx, int ky, std::uint32_t seed) {
  const double u = x * kx / kSize, v = y * ky / kSize;
  const int i = static_cast<int>(std::floor(u)), j = static_cast<int>(std::floor(v));
  const double fu = Smooth(u - i), fv = Smooth(v - j);
  const auto at = [&](int a, int b) {
    return Unit(static_cast<std::uint32_t>(Wrap(a, kx)), static_cast<std::uint32_t>(Wrap(b, ky)),
                seed);
  };
  const double top = at(i, j) + (at(i + 1, j) - at(i, j)) * fu;
  const double bottom = at(i, j + 1) + (at(i + 1, j + 1) - at(i, j + 1)) * fu;
  return top + (bottom - top) * fv;
}

// Octaves of noise, each twice as fine and half as strong; about 0..1.
double Fbm(double x, double y, int kx, int ky, int octaves, std::uint32_t seed) {
  double sum = 0, weight = 1, total = 0;
  for (int o = 0; o < octaves; ++o) {
    sum += weight * Noise(x, y, kx << o, ky << o, seed + static_cast<std::uint32_t>(o) * 101);
    total += weight;
    weight *= 0.5;
  }
  return sum / total;
}

double Wave(double x, double cycles) {
  return std::cos(2 * kPi * cycles * x / kSize);
}

// Distances to the nearest and second nearest of one jittered point per cell of an n by n
// grid, measured around the tile's wrap, and the nearest cell's number.
struct Cells {
  double f1, f2;
  int id;
};
Cells Voronoi(double x, double y, int n, std::uint32_t seed) {
  const double cell = static_cast<double>(kSize) / n;
  // Joints gather near the lattice lines; half a cell across, none of them runs along the
  // tile's edge, where a seam check would take it for one.
  x += cell / 2;
  y += cell / 2;
  const int ci = static_cast<int>(x / cell), cj = static_cast<int>(y / cell);
  Cells c{1e9, 1e9, 0};
  for (int dj = -2; dj <= 2; ++dj)
    for (int di = -2; di <= 2; ++di) {
      const int i = ci + di, j = cj + dj;
      const auto wi = static_cast<std::uint32_t>(Wrap(i, n)),
                 wj = static_cast<std::uint32_t>(Wrap(j, n));
      const double px = (i + 0.15 + 0.7 * Unit(wi, wj, seed)) * cell;
      const double py = (j + 0.15 + 0.7 * Unit(wi, wj, seed + 7)) * cell;
      const double d = std::hypot(px - x, py - y);
      if (d < c.f1) {
        c.f2 = c.f1;
        c.f1 = d;
        c.id = static_cast<int>(wj * static_cast<std::uint32_t>(n) + wi);
      } else if (d < c.f2) {
        c.f2 = d;
      }
    }
  return c;
}

using Pattern = std::function<double(double x, double y)>;

// Canvas: a plain over-under weave of threads with uneven thickness.
double Canvas(double x, double y) {
  const double over = Wave(x, 7) * Wave(y, 7) > 0 ? 1 : 0;
  const double weft = 0.5 + 0.5 * Wave(y, 14), warp = 0.5 + 0.5 * Wave(x, 14);
  const double thread = over * weft + (1 - over) * warp;
  return 0.7 * thread + 0.3 * Fbm(x, y, 8, 8, 3, 11);
}
// Paper: soft mottling with a fine grain and a few fibres.
double Paper(double x, double y) {
  const double fibres = std::pow(std::abs(Wave(x + 9 * Noise(x, y, 3, 3, 22), 5)), 12);
  return 0.45 * Fbm(x, y, 4, 4, 2, 21) + 0.45 * Noise(x, y, 29, 29, 23) + 0.1 * fibres;
}
// Brick: four courses of two bricks, every other course offset by half a brick.
double Brick(double x, double y) {
  const double course = 14.5;
  const int row = static_cast<int>((y + 3) / course) % 4;
  const double by = std::fmod(y + 3, course);
  const double bx = std::fmod(x + 5 + (row % 2) * 14.5, 29);
  const double edge = std::min({by, course - by, bx, 29 - bx});
  const double mortar = Smooth(std::clamp((edge - 0.8) / 1.6, 0.0, 1.0));
  const double face = 0.6 + 0.25 * Fbm(x, y, 6, 6, 3, 31 + static_cast<std::uint32_t>(row));
  return mortar * face + (1 - mortar) * 0.25 * Noise(x, y, 29, 29, 33);
}
// Stone: rounded cobbles with dark joints.
double Stone(double x, double y) {
  const Cells c = Voronoi(x, y, 4, 41);
  const double joint = Smooth(std::clamp((c.f2 - c.f1) / 4.0, 0.0, 1.0));
  const double dome = 1 - std::min(1.0, c.f1 / 12);
  return joint * (0.5 + 0.3 * dome + 0.2 * Fbm(x, y, 8, 8, 2, 43 + c.id));
}
// Wood: wavy grain running down the board.
double Wood(double x, double y) {
  const double bend = 1.6 * Fbm(x, y, 2, 3, 2, 51);
  const double rings = 0.5 + 0.5 * std::sin(2 * kPi * (6 * x / kSize + bend));
  return 0.75 * std::pow(rings, 0.7) + 0.25 * Noise(x, y, 29, 4, 53);
}
// Cloth: a twill with diagonal ribs.
double Cloth(double x, double y) {
  const double rib = 0.5 + 0.5 * Wave(x + y, 10);
  const double thread = 0.5 + 0.5 * Wave(x - y, 29);
  return 0.6 * rib + 0.2 * thread + 0.2 * Fbm(x, y, 8, 8, 2, 61);
}
// Crackle: glaze broken into plates by thin dark cracks.
double Crackle(double x, double y) {
  const Cells c = Voronoi(x, y, 5, 71);
  const double crack = Smooth(std::clamp((c.f2 - c.f1) / 2.2, 0.0, 1.0));
  return crack * (0.8 + 0.2 * Fbm(x, y, 4, 4, 2, 73));
}
// Sandstone: speckled grains over a soft banding.
double Sand(double x, double y) {
  const double grains = Noise(x, y, 58, 58, 81);
  return 0.4 * grains + 0.35 * Fbm(x, y, 4, 4, 3, 82) + 0.25 * (0.5 + 0.5 * Wave(y + 4 * x, 2));
}
// Burlap: a coarse, loose weave with gaps between the threads.
double Burlap(double x, double y) {
  const double jx = x + 1.5 * Noise(x, y, 4, 4, 91), jy = y + 1.5 * Noise(x, y, 4, 4, 92);
  const double warp = std::pow(0.5 + 0.5 * Wave(jx, 10), 0.5);
  const double weft = std::pow(0.5 + 0.5 * Wave(jy, 10), 0.5);
  const double over = Wave(jx, 5) * Wave(jy, 5) > 0 ? 1 : 0;
  return std::max(warp, weft) * (0.75 + 0.25 * over) * (0.8 + 0.2 * Noise(x, y, 29, 29, 93));
}
// Leather: pebbled bumps with creases between them.
double Leather(double x, double y) {
  const Cells c = Voronoi(x, y, 9, 101);
  const double crease = Smooth(std::clamp((c.f2 - c.f1) / 1.5, 0.0, 1.0));
  return 0.35 + 0.45 * crease * (1 - c.f1 / 8) + 0.2 * Noise(x, y, 29, 29, 103);
}
// Plaster: trowelled ridges.
double Plaster(double x, double y) {
  return 1 - std::abs(2 * Fbm(x, y, 3, 3, 4, 111) - 1);
}
// Ripples: water-like bands bent by a slow swell.
double Ripple(double x, double y) {
  const double swell = 3 * Fbm(x, y, 2, 2, 2, 121);
  return 0.8 * (0.5 + 0.5 * std::sin(2 * kPi * (4 * y / kSize + 1 * x / kSize) + swell)) +
         0.2 * Noise(x, y, 29, 29, 123);
}
// Hammered metal: shallow round dents lit from the top left.
double Hammered(double x, double y) {
  const Cells c = Voronoi(x, y, 6, 131);
  const double dx = 0.01, lit = Voronoi(x + dx, y + dx, 6, 131).f1 - c.f1;
  return 0.5 + 0.35 * std::clamp(lit / dx / 2, -1.0, 1.0) + 0.15 * Noise(x, y, 58, 58, 133);
}
// Bark: deep vertical furrows.
double Bark(double x, double y) {
  const double ridges = 1 - std::abs(2 * Fbm(x, y, 6, 1, 3, 141) - 1);
  return 0.7 * std::pow(ridges, 1.5) + 0.3 * Noise(x, y, 29, 6, 143);
}
// Mosaic: square tesserae of uneven shade in pale grout.
double Mosaic(double x, double y) {
  const double size = 58.0 / 5;
  const double tx = std::fmod(x + 6, size), ty = std::fmod(y + 6, size);
  const double edge = std::min({tx, ty, size - tx, size - ty});
  const int id = static_cast<int>((x + 6) / size) % 5 * 5 + static_cast<int>((y + 6) / size) % 5;
  const double shade = 0.2 + 0.4 * Unit(static_cast<std::uint32_t>(id), 1, 151);
  return edge < 1.2 ? 0.9 + 0.1 * Noise(x, y, 29, 29, 152) : shade + 0.1 * Noise(x, y, 8, 8, 153);
}

const std::array<Pattern, 15> kPatterns{Canvas,  Paper,   Brick,    Stone,  Wood,
                                        Cloth,   Crackle, Sand,     Burlap, Leather,
                                        Plaster, Ripple,  Hammered, Bark,   Mosaic};

// The lightness in percent of gray g, as the RGB-to-HSL conversion gives it: Round(g / 255 *
// 100) with halves to even.
int LightnessOf(int g) {
  return static_cast<int>(std::nearbyint(g / 255.0L * 100));
}

struct Tile {
  std::vector<std::uint8_t> gray;  // top row first
  double mean = 0;
  int min = 0, max = 0;
};

// Lightness value t (0..1 between the table's minimum and maximum) as the gray nearest to it
// whose lightness stays within those limits.
int GrayFor(double t, const Target& target) {
  const double l = target.min + t * (target.max - target.min);
  int g = static_cast<int>(std::lround(l * 2.55));
  while (LightnessOf(g) < target.min) ++g;
  while (LightnessOf(g) > target.max) --g;
  return g;
}

Tile Bend(const std::vector<double>& field, const Target& target, double gamma) {
  Tile t;
  t.min = 101;
  t.max = -1;
  double sum = 0;
  for (double f : field) {
    const int g = GrayFor(std::pow(f, gamma), target);
    t.gray.push_back(static_cast<std::uint8_t>(g));
    const int l = LightnessOf(g);
    sum += l;
    t.min = std::min(t.min, l);
    t.max = std::max(t.max, l);
  }
  t.mean = sum / static_cast<double>(field.size());
  return t;
}

Tile Draw(const Pattern& pattern, const Target& target) {
  std::vector<double> field;
  for (int y = 0; y < kSize; ++y)
    for (int x = 0; x < kSize; ++x) field.push_back(pattern(x, y));
  const auto [lo, hi] = std::minmax_element(field.begin(), field.end());
  const double a = *lo, b = *hi;
  for (double& f : field) f = (f - a) / (b - a);
  // The mean falls as gamma grows; bisect on its logarithm.
  double low = std::log(0.02), high = std::log(50.0);
  Tile best = Bend(field, target, 1);
  for (int i = 0; i < 60; ++i) {
    const double mid = (low + high) / 2;
    const Tile t = Bend(field, target, std::exp(mid));
    if (std::abs(t.mean - target.mean) < std::abs(best.mean - target.mean)) best = t;
    (t.mean > target.mean ? low : high) = mid;
  }
  return best;
}

void Put16(std::vector<std::uint8_t>& b, unsigned v) {
  b.push_back(static_cast<std::uint8_t>(v));
  b.push_back(static_cast<std::uint8_t>(v >> 8));
}
void Put32(std::vector<std::uint8_t>& b, std::uint32_t v) {
  Put16(b, v & 0xFFFF);
  Put16(b, v >> 16);
}

// A bottom-up BMP of the tile: 24-bit, or 8-bit with palette entry i = gray (i, i, i).
std::vector<std::uint8_t> Encode(const Tile& tile, bool paletted) {
  const int bytesPerPixel = paletted ? 1 : 3;
  const int stride = (kSize * bytesPerPixel + 3) & ~3;
  const std::uint32_t paletteSize = paletted ? 256 * 4 : 0;
  const std::uint32_t offset = 14 + 40 + paletteSize;
  const std::uint32_t imageSize = static_cast<std::uint32_t>(stride * kSize);
  std::vector<std::uint8_t> b{'B', 'M'};
  Put32(b, offset + imageSize);
  Put32(b, 0);
  Put32(b, offset);
  Put32(b, 40);
  Put32(b, kSize);
  Put32(b, kSize);
  Put16(b, 1);
  Put16(b, paletted ? 8 : 24);
  Put32(b, 0);
  Put32(b, imageSize);
  Put32(b, 2835);
  Put32(b, 2835);
  Put32(b, paletted ? 256 : 0);
  Put32(b, 0);
  for (std::uint32_t i = 0; i < paletteSize / 4; ++i) {
    const auto g = static_cast<std::uint8_t>(i);
    b.insert(b.end(), {g, g, g, 0});
  }
  for (int y = kSize - 1; y >= 0; --y) {
    const std::size_t start = b.size();
    for (int x = 0; x < kSize; ++x) {
      const std::uint8_t g = tile.gray[static_cast<std::size_t>(y * kSize + x)];
      for (int c = 0; c < bytesPerPixel; ++c) b.push_back(g);
    }
    b.resize(start + static_cast<std::size_t>(stride), 0);
  }
  return b;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: make_texture_tiles <folder>\n";
    return 2;
  }
  int failures = 0;
  for (std::size_t n = 0; n < kPatterns.size(); ++n) {
    const Target& target = kTargets[n];
    const Tile tile = Draw(kPatterns[n], target);
    const bool ok = tile.min == target.min && tile.max == target.max &&
                    std::abs(tile.mean - target.mean) <= 0.25;
    std::printf("tile %2zu: %3d / %6.2f / %3d  (wanted %d / %.1f / %d)%s\n", n + 1, tile.min,
                tile.mean, tile.max, target.min, target.mean, target.max, ok ? "" : "  FAILED");
    failures += ok ? 0 : 1;
    const std::vector<std::uint8_t> bytes = Encode(tile, n + 1 == 5);
    std::ofstream out(std::string(argv[1]) + "/" + std::to_string(n + 1) + ".bmp",
                      std::ios::binary);
    out.write(reinterpret_cast<const char*>(bytes.data()),
              static_cast<std::streamsize>(bytes.size()));
    if (!out) {
      std::cerr << "cannot write tile " << n + 1 << "\n";
      return 1;
    }
  }
  return failures == 0 ? 0 : 1;
}
