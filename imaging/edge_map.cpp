#include "imaging/edge_map.h"

#include <algorithm>
#include <cstring>
#include <thread>
#include <vector>

#include "imaging/edge_byte.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

void CopyColour(Pixel& to, const Pixel& from) {
  to.b = from.b;
  to.g = from.g;
  to.r = from.r;
}

// One interior row, already inverted. The kernels treat the three colour channels alike and
// never mix them, so the row is walked as bytes: the neighbours of a byte sit 4 bytes to
// either side. That lets the compiler process many bytes at once; the alpha bytes get a
// meaningless value here and are put back by the caller.
void InvertedResponseRow(const std::uint8_t* __restrict above, const std::uint8_t* __restrict row,
                         const std::uint8_t* __restrict below, std::uint8_t* __restrict out,
                         int bytes) {
  for (int i = 4; i < bytes - 4; ++i) out[i] = InvertedEdgeByte(above, row, below, i);
}

// Pictures without an interior pixel: only the border copies and the inversion apply.
void SmallPicsobel(Bitmap32& bitmap) {
  const int w = bitmap.Width();
  const int h = bitmap.Height();
  const int innerLeft = std::min(1, w - 1);
  const int innerRight = std::max(w - 2, 0);
  for (int y = 1; y < h - 1; ++y) {
    Pixel* row = bitmap.ScanLine(y);
    CopyColour(row[0], row[innerLeft]);
    CopyColour(row[w - 1], row[innerRight]);
  }
  const auto copyRow = [&](int to, int from) {
    if (to == from) return;
    Pixel* dst = bitmap.ScanLine(to);
    const Pixel* src = bitmap.ScanLine(from);
    for (int x = 0; x < w; ++x) CopyColour(dst[x], src[x]);
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

}  // namespace

void InvertedSobelEdges(Bitmap32& bitmap) {
  const int w = bitmap.Width();
  const int h = bitmap.Height();
  if (w == 0) return;
  if (w < 3 || h < 3) {
    SmallPicsobel(bitmap);
    return;
  }

  // The interior rows are split into bands and each band is rewritten in place, top to bottom,
  // keeping the untouched input of the row above in a buffer of its own. Neighbourhoods thus
  // always see the input, as if read from a snapshot of the whole picture, without making one.
  // A band's first and last rows read rows that neighbouring bands rewrite, so those two rows
  // of each band are kept before any band starts.
  const int interior = h - 2;
  const int bands = RowBands(interior, static_cast<std::size_t>(w) * 9);
  const auto bandStart = [&](int i) {
    return 1 + static_cast<int>(static_cast<long long>(interior) * i / bands);
  };
  const std::size_t rowBytes = static_cast<std::size_t>(w) * sizeof(Pixel);
  std::vector<Pixel> edgeRows(2 * static_cast<std::size_t>(bands) * static_cast<std::size_t>(w));
  for (int i = 0; i < bands; ++i) {
    Pixel* keep = edgeRows.data() + 2 * static_cast<std::size_t>(i) * static_cast<std::size_t>(w);
    std::memcpy(keep, bitmap.ScanLine(bandStart(i) - 1), rowBytes);
    std::memcpy(keep + w, bitmap.ScanLine(bandStart(i + 1)), rowBytes);
  }

  ParallelRows(
      0, bands, static_cast<std::size_t>(w) * 9 * static_cast<std::size_t>(interior / bands + 1),
      [&](int b0, int b1) {
        std::vector<Pixel> buffers(2 * static_cast<std::size_t>(w));
        for (int band = b0; band < b1; ++band) {
          const Pixel* keptAbove =
              edgeRows.data() + 2 * static_cast<std::size_t>(band) * static_cast<std::size_t>(w);
          const Pixel* keptBelow = keptAbove + w;
          const int y0 = bandStart(band), y1 = bandStart(band + 1);
          Pixel* above = buffers.data();
          Pixel* current = buffers.data() + w;
          std::memcpy(above, keptAbove, rowBytes);
          for (int y = y0; y < y1; ++y) {
            Pixel* row = bitmap.ScanLine(y);
            std::memcpy(current, row, rowBytes);
            const Pixel* below = y + 1 == y1 ? keptBelow : bitmap.ScanLine(y + 1);
            InvertedResponseRow(reinterpret_cast<const std::uint8_t*>(above),
                                reinterpret_cast<const std::uint8_t*>(current),
                                reinterpret_cast<const std::uint8_t*>(below),
                                reinterpret_cast<std::uint8_t*>(row), static_cast<int>(rowBytes));
            // Interior alpha stays as it was; the side pixels repeat their neighbours.
            for (int x = 1; x < w - 1; ++x) row[x].a = current[x].a;
            CopyColour(row[0], row[1]);
            CopyColour(row[w - 1], row[w - 2]);
            std::swap(above, current);
          }
        }
      });

  // The top and bottom rows repeat their inner neighbours, corners included.
  Pixel* top = bitmap.ScanLine(0);
  const Pixel* second = bitmap.ScanLine(1);
  Pixel* bottom = bitmap.ScanLine(h - 1);
  const Pixel* penultimate = bitmap.ScanLine(h - 2);
  for (int x = 0; x < w; ++x) {
    CopyColour(top[x], second[x]);
    CopyColour(bottom[x], penultimate[x]);
  }
}

}  // namespace quillane
