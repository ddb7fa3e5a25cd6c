#include "imaging/edge_map.h"

#include <algorithm>

#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

inline int Response(const Pixel* above, const Pixel* row, const Pixel* below, int x,
                    std::uint8_t Pixel::*channel) {
  const int ul = above[x - 1].*channel, uc = above[x].*channel, ur = above[x + 1].*channel;
  const int ml = row[x - 1].*channel, mc = row[x].*channel, mr = row[x + 1].*channel;
  const int dl = below[x - 1].*channel, dc = below[x].*channel, dr = below[x + 1].*channel;
  const int a = 6 * mc - (ul + uc + ur) - (dl + dc + dr);
  const int b = (ul + ml + dl) - (ur + mr + dr);
  return std::max(ClampByte(a), ClampByte(b));
}

}  // namespace

void picsobel(TBitmap32& bitmap) {
  const int w = bitmap.Width();
  const int h = bitmap.Height();
  if (w == 0) return;

  // Neighbourhoods are read from an untouched snapshot, so the visiting order (and the split
  // of rows between threads) cannot change the result.
  const TBitmap32 snapshot = bitmap;

  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * 9, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const Pixel* above = snapshot.ScanLine(y - 1);
      const Pixel* row = snapshot.ScanLine(y);
      const Pixel* below = snapshot.ScanLine(y + 1);
      Pixel* out = bitmap.ScanLine(y);
      for (int x = 1; x < w - 1; ++x) {
        out[x].b = static_cast<std::uint8_t>(Response(above, row, below, x, &Pixel::b));
        out[x].g = static_cast<std::uint8_t>(Response(above, row, below, x, &Pixel::g));
        out[x].r = static_cast<std::uint8_t>(Response(above, row, below, x, &Pixel::r));
      }
    }
  });

  const auto copyColour = [](Pixel& to, const Pixel& from) {
    to.b = from.b;
    to.g = from.g;
    to.r = from.r;
  };
  // Left and right columns repeat their inner neighbours, on the interior rows only.
  const int innerLeft = std::min(1, w - 1);
  const int innerRight = std::max(w - 2, 0);
  for (int y = 1; y < h - 1; ++y) {
    Pixel* row = bitmap.ScanLine(y);
    copyColour(row[0], row[innerLeft]);
    copyColour(row[w - 1], row[innerRight]);
  }
  // Then the top and bottom rows repeat theirs, corners included.
  const auto copyRow = [&](int to, int from) {
    if (to == from) return;
    Pixel* dst = bitmap.ScanLine(to);
    const Pixel* src = bitmap.ScanLine(from);
    for (int x = 0; x < w; ++x) copyColour(dst[x], src[x]);
  };
  copyRow(0, std::min(1, h - 1));
  copyRow(h - 1, std::max(h - 2, 0));

  Pixel* p = bitmap.Data();
  const std::size_t n = bitmap.PixelCount();
  for (std::size_t i = 0; i < n; ++i) {
    p[i].b = static_cast<std::uint8_t>(255 - p[i].b);
    p[i].g = static_cast<std::uint8_t>(255 - p[i].g);
    p[i].r = static_cast<std::uint8_t>(255 - p[i].r);
  }
}

}  // namespace quillane
