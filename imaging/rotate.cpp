#include "imaging/rotate.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <vector>

#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

using Index = std::int64_t;

// Square blocks copied at a time, so that walking down source columns stays within a few
// cache lines per source row.
constexpr int kTile = 32;

struct Range {
  Index lo;
  Index hi;  // inclusive; the range is empty when lo > hi
  bool Empty() const { return lo > hi; }
};

// The i in [0, count) for which first + step * i lies in [0, limit); step is 1 or -1.
Range IndicesInside(Index first, int step, Index count, Index limit) {
  const Index lo = step > 0 ? -first : first - (limit - 1);
  const Index hi = step > 0 ? limit - 1 - first : first;
  return {std::max<Index>(lo, 0), std::min<Index>(hi, count - 1)};
}

// The values first + step * i for i in indices, lowest first.
Range Values(Index first, int step, Range indices) {
  const Index a = first + step * indices.lo;
  const Index b = first + step * indices.hi;
  return {std::min(a, b), std::max(a, b)};
}

}  // namespace

int RotationCentre(int side) {
  return Round(static_cast<Extended>(side) / 2);
}

std::optional<Bitmap32> RotatePicture(const Bitmap32& source, int cx, int cy, QuarterTurn turn) {
  const Index w = source.Width();
  const Index h = source.Height();
  if (w < 1 || h < 1) return std::nullopt;
  // The sum in 64 bits: in 32 it would overflow for sides above 46340.
  const Extended d = std::sqrt(static_cast<Extended>(w * w + h * h));
  const Index padX = Round((d - static_cast<Extended>(w)) / 2);
  const Index padY = Round((d - static_cast<Extended>(h)) / 2);
  const Index canvasW = w + 2 * padX;
  const Index canvasH = h + 2 * padY;
  const Index ax = cx + padX;
  const Index ay = cy + padY;

  // Canvas row y of B shows source column u = ou + su * y, canvas column x shows source row
  // v = ov + sv * x; everything else is fill.
  const bool clockwise = turn == QuarterTurn::Clockwise;
  const int su = clockwise ? 1 : -1;
  const int sv = -su;
  const Index ou = clockwise ? cx - ay : cx + ay;
  const Index ov = clockwise ? cy + ax : cy - ax;
  const Range yReach = IndicesInside(ou, su, canvasH, w);
  const Range xReach = IndicesInside(ov, sv, canvasW, h);

  std::vector<const Pixel*> rows(static_cast<std::size_t>(h));
  for (Index v = 0; v < h; ++v)
    rows[static_cast<std::size_t>(v)] = source.ScanLine(static_cast<int>(v));

  // The outermost source rows and columns within reach that hold a pixel other than the fill
  // colour: they decide the trim. Each scan stops at the first such pixel, so a photo costs a
  // few pixels per row.
  Index minU = w, maxU = -1, minV = h, maxV = -1;
  if (!yReach.Empty() && !xReach.Empty()) {
    const Range us = Values(ou, su, yReach);
    const Range vs = Values(ov, sv, xReach);
    const auto rowHolds = [&](Index v) {
      const Pixel* row = rows[static_cast<std::size_t>(v)];
      for (Index u = us.lo; u <= us.hi; ++u)
        if (!(row[u] == kRotationFill)) return true;
      return false;
    };
    for (Index v = vs.lo; v <= vs.hi && minV == h; ++v)
      if (rowHolds(v)) minV = v;
    for (Index v = vs.hi; v >= minV && maxV < 0; --v)
      if (rowHolds(v)) maxV = v;
    for (Index v = minV; v <= maxV; ++v) {
      const Pixel* row = rows[static_cast<std::size_t>(v)];
      for (Index u = us.lo; u <= std::min(us.hi, minU - 1); ++u)
        if (!(row[u] == kRotationFill)) {
          minU = u;
          break;
        }
      for (Index u = us.hi; u >= std::max(us.lo, maxU + 1); --u)
        if (!(row[u] == kRotationFill)) {
          maxU = u;
          break;
        }
    }
  }
  Index top = 0;
  Index left = 0;
  if (maxV >= 0) {
    top = su > 0 ? minU - ou : ou - maxU;
    left = sv > 0 ? minV - ov : ov - maxV;
  }

  const Index outW = canvasW - 2 * left;
  const Index outH = canvasH - 2 * top;
  if (outW < 1 || outH < 1) return std::nullopt;
  if (outW * outH > Bitmap32::kMaxPixels)
    throw std::length_error("The turned picture would be too large");
  Bitmap32 result(static_cast<int>(outW), static_cast<int>(outH), kRotationFill);

  // Result pixel (x, y) is canvas pixel (left + x, top + y): source (u0 + su y, v0 + sv x).
  const Index u0 = ou + su * top;
  const Index v0 = ov + sv * left;
  const Range ys = IndicesInside(u0, su, outH, w);
  const Range xs = IndicesInside(v0, sv, outW, h);
  if (ys.Empty() || xs.Empty()) return result;
  const Pixel* const* from = rows.data();
  ParallelRows(static_cast<int>(ys.lo), static_cast<int>(ys.hi) + 1, static_cast<std::size_t>(outW),
               [&](int y0, int y1) {
                 for (int yb = y0; yb < y1; yb += kTile) {
                   const int ye = std::min(yb + kTile, y1);
                   for (Index xb = xs.lo; xb <= xs.hi; xb += kTile) {
                     const Index xe = std::min<Index>(xb + kTile, xs.hi + 1);
                     for (int y = yb; y < ye; ++y) {
                       const Index u = u0 + su * y;
                       Pixel* out = result.ScanLine(y);
                       for (Index x = xb; x < xe; ++x) out[x] = from[v0 + sv * x][u];
                     }
                   }
                 }
               });
  return result;
}

}  // namespace quillane
