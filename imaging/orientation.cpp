#include "imaging/orientation.h"

#include <algorithm>
#include <cstdint>
#include <vector>

#include "imaging/parallel.h"

namespace quillane {
namespace {

// Square blocks copied at a time, so that walking down source columns stays within a few
// cache lines per source row.
constexpr int kTile = 32;

void MirrorRows(Bitmap32& picture) {
  const int w = picture.Width();
  ParallelRows(0, picture.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) std::reverse(picture.ScanLine(y), picture.ScanLine(y) + w);
  });
}

void SwapTopAndBottom(Bitmap32& picture) {
  const int h = picture.Height();
  const int w = picture.Width();
  for (int y = 0; y < h / 2; ++y) {
    Pixel* top = picture.ScanLine(y);
    std::swap_ranges(top, top + w, picture.ScanLine(h - 1 - y));
  }
}

// out(x, y) = stored(u, v) with u = y or W-1-y, v = x or H-1-x: out is H by W.
Bitmap32 Transposed(const Bitmap32& stored, bool reverseU, bool reverseV) {
  const int w = stored.Width();
  const int h = stored.Height();
  Bitmap32 out = Bitmap32::ForOverwrite(h, w);
  std::vector<const Pixel*> rows(static_cast<std::size_t>(h));
  for (int v = 0; v < h; ++v) rows[static_cast<std::size_t>(v)] = stored.ScanLine(v);
  const Pixel* const* from = rows.data();
  ParallelRows(0, w, static_cast<std::size_t>(h), [&](int y0, int y1) {
    for (int yb = y0; yb < y1; yb += kTile) {
      const int ye = std::min(yb + kTile, y1);
      for (int xb = 0; xb < h; xb += kTile) {
        const int xe = std::min(xb + kTile, h);
        for (int y = yb; y < ye; ++y) {
          const int u = reverseU ? w - 1 - y : y;
          Pixel* row = out.ScanLine(y);
          if (reverseV) {
            for (int x = xb; x < xe; ++x) row[x] = from[h - 1 - x][u];
          } else {
            for (int x = xb; x < xe; ++x) row[x] = from[x][u];
          }
        }
      }
    }
  });
  return out;
}

}  // namespace

Bitmap32 UprightPicture(Bitmap32 stored, int orientation) {
  if (stored.Empty()) return stored;
  switch (orientation) {
    case 2:
      MirrorRows(stored);
      return stored;
    case 3:
      MirrorRows(stored);
      SwapTopAndBottom(stored);
      return stored;
    case 4:
      SwapTopAndBottom(stored);
      return stored;
    case 5:
      return Transposed(stored, false, false);
    case 6:
      return Transposed(stored, false, true);
    case 7:
      return Transposed(stored, true, true);
    case 8:
      return Transposed(stored, true, false);
    default:
      return stored;
  }
}

}  // namespace quillane
