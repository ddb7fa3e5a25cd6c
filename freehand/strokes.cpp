#include "freehand/strokes.h"

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "imaging/numeric.h"

namespace quillane {
namespace {

// Pointer positions far outside any picture (a drag that left the window) are pulled in this
// far, which keeps all arithmetic on them well inside int.
constexpr int kFarAway = 1 << 24;
int Near(int v) {
  return std::clamp(v, -kFarAway, kFarAway);
}

// The disc as row spans: for row offset dy (0..size), columns x - reach[dy] .. x + reach[dy]
// are covered. A column at distance d covers rows up to k(d) = Round(sqrt(size^2 - d^2)); k
// falls as d grows, so each row's columns are one run, the widest d whose k reaches |dy|.
std::vector<int> DiscReach(int size) {
  std::vector<int> reach(static_cast<std::size_t>(size) + 1, -1);
  for (int d = 0; d <= size; ++d) {
    const Extended k2 = static_cast<Extended>(size) * size - static_cast<Extended>(d) * d;
    const int k = std::min(size, Round(std::sqrt(k2)));
    for (int dy = 0; dy <= k; ++dy) reach[static_cast<std::size_t>(dy)] = d;
  }
  return reach;
}

template <typename Paint>
PaintRect ForDisc(Bitmap32& picture, int x, int y, int size, Paint paint) {
  size = std::max(size, 0);
  x = Near(x);
  y = Near(y);
  const PaintRect bounds = DiscBounds(picture, x, y, size);
  if (bounds.Empty()) return bounds;
  const std::vector<int> reach = DiscReach(size);
  for (int row = bounds.top; row < bounds.bottom; ++row) {
    const int r = reach[static_cast<std::size_t>(std::abs(row - y))];
    if (r < 0) continue;
    const int from = std::max(x - r, 0);
    const int to = std::min(x + r + 1, picture.Width());
    Pixel* line = picture.ScanLine(row);
    for (int col = from; col < to; ++col) paint(line[col]);
  }
  return bounds;
}

}  // namespace

PaintRect DiscBounds(const Bitmap32& picture, int x, int y, int size) {
  size = std::max(size, 0);
  x = Near(x);
  y = Near(y);
  return PaintRect{x - size, y - size, x + size + 1, y + size + 1}.ClippedTo(picture);
}

PaintRect RubDisc(Bitmap32& picture, int x, int y, int size) {
  return ForDisc(picture, x, y, size, [](Pixel& p) { p = kPaperWhite; });
}

PaintRect BrushDisc(Bitmap32& picture, int x, int y, int size, const FreehandHsl& brush) {
  // Strokes are mostly a few shades of gray, and BrushColour depends on nothing but the pixel's
  // colour: the last answer is kept for the next pixel.
  Pixel lastIn{0, 0, 0, 0};
  Pixel lastOut = BrushColour(lastIn, brush);
  return ForDisc(picture, x, y, size, [&](Pixel& p) {
    if (IsPaperColor(p)) return;
    if (!SameColor(p, lastIn)) {
      lastIn = p;
      lastOut = BrushColour(p, brush);
    }
    p = lastOut;
  });
}

PaintRect LineBounds(const Bitmap32& picture, int x0, int y0, int x1, int y1, int width) {
  x0 = Near(x0), y0 = Near(y0), x1 = Near(x1), y1 = Near(y1);
  const int r = std::max(width, 1) / 2 + 1;
  return PaintRect{std::min(x0, x1) - r, std::min(y0, y1) - r, std::max(x0, x1) + r + 1,
                   std::max(y0, y1) + r + 1}
      .ClippedTo(picture);
}

PaintRect DrawLine(Bitmap32& picture, LinePen& pen, int x0, int y0, int x1, int y1, bool withEnd) {
  x0 = Near(x0), y0 = Near(y0), x1 = Near(x1), y1 = Near(y1);
  const Pixel color{pen.color.b, pen.color.g, pen.color.r, 255};
  PaintRect changed;
  if (pen.width <= 1) {
    constexpr int kDashOn = 18, kDashPeriod = 24;
    const int dx = std::abs(x1 - x0), dy = -std::abs(y1 - y0);
    const int sx = x0 < x1 ? 1 : -1, sy = y0 < y1 ? 1 : -1;
    std::int64_t err = dx + dy;
    int x = x0, y = y0;
    for (;;) {
      const bool last = x == x1 && y == y1;
      if (last && !withEnd) break;
      if (pen.dashPhase < kDashOn && x >= 0 && y >= 0 && x < picture.Width() &&
          y < picture.Height()) {
        picture.ScanLine(y)[x] = color;
        changed = changed.United(PaintRect{x, y, x + 1, y + 1});
      }
      pen.dashPhase = (pen.dashPhase + 1) % kDashPeriod;
      if (last) break;
      const std::int64_t e2 = 2 * err;
      if (e2 >= dy) err += dy, x += sx;
      if (e2 <= dx) err += dx, y += sy;
    }
    return changed;
  }
  // Pixel centres closer than width / 2 to the segment; an odd width is centred on the pixel
  // centres of the end points, an even one on their top-left corners.
  const double offset = pen.width % 2 != 0 ? 0.5 : 0.0;
  const double ax = x0 + offset, ay = y0 + offset, bx = x1 + offset, by = y1 + offset;
  const double vx = bx - ax, vy = by - ay;
  const double length2 = vx * vx + vy * vy;
  const double radius2 = pen.width * pen.width / 4.0;
  const PaintRect bounds = LineBounds(picture, x0, y0, x1, y1, pen.width);
  for (int row = bounds.top; row < bounds.bottom; ++row) {
    Pixel* line = picture.ScanLine(row);
    const double py = row + 0.5;
    for (int col = bounds.left; col < bounds.right; ++col) {
      const double px = col + 0.5;
      double t = length2 > 0 ? ((px - ax) * vx + (py - ay) * vy) / length2 : 0.0;
      t = std::clamp(t, 0.0, 1.0);
      const double ex = px - (ax + t * vx), ey = py - (ay + t * vy);
      if (ex * ex + ey * ey < radius2) {
        line[col] = color;
        changed = changed.United(PaintRect{col, row, col + 1, row + 1});
      }
    }
  }
  return changed;
}

void Thin(Bitmap32& picture) {
  const int w = picture.Width(), h = picture.Height();
  if (w < 3 || h < 3) return;
  Bitmap32 result = picture;
  const Pixel white{255, 255, 255, 255};
  const Pixel tint{kPaperTint.b, kPaperTint.g, kPaperTint.r, 0};
  for (int y = 1; y < h - 1; ++y) {
    const Pixel* up = picture.ScanLine(y - 1);
    const Pixel* mid = picture.ScanLine(y);
    const Pixel* down = picture.ScanLine(y + 1);
    Pixel* out = result.ScanLine(y);
    for (int x = 1; x < w - 1; ++x) {
      // NW, N, NE, E, SE, S, SW, W.
      const Pixel ring[8] = {up[x - 1],   up[x],   up[x + 1],   mid[x + 1],
                             down[x + 1], down[x], down[x - 1], mid[x - 1]};
      bool paper[8];
      int papers = 0;
      for (int i = 0; i < 8; ++i) papers += (paper[i] = IsPaperColor(ring[i])) ? 1 : 0;
      if (papers < 2 || papers > 6) continue;
      int changes = 0;
      for (int i = 0; i < 8; ++i) changes += (!paper[i] && paper[(i + 1) % 8]) ? 1 : 0;
      if (changes != 1) continue;
      const bool n = !paper[1], e = !paper[3], s = !paper[5], wst = !paper[7];
      if (!(n || e || s) || !(wst || e || s)) continue;
      const bool whiteBeside = SameColor(ring[7], white) || SameColor(ring[3], white) ||
                               SameColor(ring[1], white) || SameColor(ring[5], white);
      out[x] = whiteBeside ? white : tint;
    }
  }
  picture = std::move(result);
}

void Thick(Bitmap32& picture) {
  const int w = picture.Width(), h = picture.Height();
  if (w < 3 || h < 3) return;
  const Bitmap32 before = picture;
  for (int y = 1; y < h - 1; ++y) {
    const Pixel* up = before.ScanLine(y - 1);
    const Pixel* mid = before.ScanLine(y);
    const Pixel* down = before.ScanLine(y + 1);
    Pixel* out = picture.ScanLine(y);
    for (int x = 1; x < w - 1; ++x) {
      // W, E, N, S: the last one that qualifies wins.
      const Pixel around[4] = {mid[x - 1], mid[x + 1], up[x], down[x]};
      Pixel& p = out[x];
      for (const Pixel reference : {kPaperWhite, kPaperTint}) {
        if (!SameColor(p, reference)) continue;
        for (const Pixel n : around)
          if (!SameColor(n, reference)) p = Pixel{n.b, n.g, n.r, 255};
      }
    }
  }
}

}  // namespace quillane
