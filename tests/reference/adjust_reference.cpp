#include "tests/reference/adjust_reference.h"

#include <bit>
#include <cstdint>
#include <cstring>

#include "imaging/tone.h"

namespace quillane {
namespace {

Bitmap32 ZonedReference(const Bitmap32& source, PanelLayout layout) {
  const int w = source.Width(), h = source.Height();
  Bitmap32 out(w, h);
  if (h > 0)
    std::memcpy(out.ScanLine(0), source.ScanLine(0), sizeof(Pixel) * static_cast<std::size_t>(w));
  for (int y = 1; y < h; ++y) {
    const Pixel* in = source.ScanLine(y);
    Pixel* row = out.ScanLine(y);
    row[0] = in[0];
    for (int x = 1; x < w; ++x)
      row[x] = ColorPanelTinted(in[x], layout, ColorPanelZone(layout, w, h, x, y));
  }
  return out;
}

Bitmap32 Panel2x2Reference(const Bitmap32& source) {
  Bitmap32 base = source;
  Bitmap32 small = source;
  ResampleNearest(small, 0.5L, 0.5L);
  const int w = small.Width(), h = small.Height();
  const auto put = [](Pixel& target, Pixel p, int quadrant) {
    const Pixel q = ColorPanelTinted(p, PanelLayout::Panel2x2, quadrant);
    target = Pixel{q.b, q.g, q.r, target.a};
  };
  for (int y = 1; y < h; ++y) {
    const Pixel* s = small.ScanLine(y);
    Pixel* top = base.ScanLine(y);
    Pixel* bottom = base.ScanLine(h + y);
    for (int x = 1; x < w; ++x) {
      put(top[x], s[x], 0);
      put(top[w + x], s[x], 1);
      put(bottom[x], s[x], 2);
      put(bottom[w + x], s[x], 3);
    }
  }
  return base;
}

Bitmap32 Panel3x3Reference(const Bitmap32& source) {
  Bitmap32 small = source;
  ResampleNearest(small, 1.0L / 3, 1.0L / 3);
  if (small.Empty()) return Bitmap32();
  const int w = small.Width(), h = small.Height();
  Bitmap32 out(3 * w, 3 * h);
  for (int y = 0; y < 3 * h; ++y) {
    const Pixel* s = small.ScanLine(y % h);
    Pixel* row = out.ScanLine(y);
    for (int c = 0; c < 3; ++c)
      for (int x = 0; x < w; ++x) {
        Pixel p = ColorPanelTinted(s[x], PanelLayout::Panel3x3, 3 * (y / h) + c);
        p.a = 0;
        row[c * w + x] = p;
      }
  }
  return out;
}

}  // namespace

Bitmap32 FilterReference(const Bitmap32& base, ColorFilterKind kind) {
  const std::uint32_t set = ColorFilterRaisedChannels(kind);
  Bitmap32 out = base;
  const int w = out.Width();
  for (int y = 0; y < out.Height(); ++y) {
    Pixel* row = out.ScanLine(y);
    ConvertRowToGray(row, w);
    for (int x = 0; x < w; ++x)
      row[x] = std::bit_cast<Pixel>(std::bit_cast<std::uint32_t>(row[x]) | set);
  }
  return out;
}

Bitmap32 ColorPanelReference(const Bitmap32& source, PanelLayout layout) {
  switch (layout) {
    case PanelLayout::Panel2x2:
      return Panel2x2Reference(source);
    case PanelLayout::Panel3x3:
      return Panel3x3Reference(source);
    case PanelLayout::Pane2x2:
    case PanelLayout::Pane3x3:
    case PanelLayout::Catercorner4:
    case PanelLayout::Catercorner16:
      return ZonedReference(source, layout);
  }
  return source;
}

}  // namespace quillane
