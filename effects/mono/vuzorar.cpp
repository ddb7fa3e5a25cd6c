// Vuzorar: the pen drawing with every ink pixel drawn out into a short hatching stroke.
#include "effects/mono/vuzorar.h"

#include <algorithm>
#include <stdexcept>
#include <vector>

#include "effects/mono/pen_sketch.h"
#include "effects/registry.h"
#include "imaging/edge_map.h"
#include "imaging/ink_rows.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/vector_dispatch.h"

namespace quillane {

HatchNeighbours HatchNeighboursOf(HatchDirection direction) {
  switch (direction) {
    case HatchDirection::Rising:
      return {-1, 1, 1, -1};
    case HatchDirection::Falling:
      return {-1, -1, 1, 1};
    case HatchDirection::Vertical:
      return {0, -1, 0, 1};
    case HatchDirection::Horizontal:
      return {-1, 0, 1, 0};
  }
  throw std::invalid_argument("no such hatching direction");
}

namespace {

// One dilation pass over an interior row, from the rows above, at and below it before the
// pass (ink 0, paper 0xFF: ink spreads by AND). Compiled for any x86-64 and for AVX2.
[[gnu::always_inline]] inline void DilateLoop(const std::uint8_t* const rows[3],
                                              std::uint8_t* __restrict out, int w,
                                              const HatchNeighbours& n) {
  const std::uint8_t* __restrict self = rows[1];
  const std::uint8_t* __restrict first = rows[1 + n.dy1];
  const std::uint8_t* __restrict second = rows[1 + n.dy2];
  out[0] = self[0];
  for (int x = 1; x < w - 1; ++x) out[x] = self[x] & first[x + n.dx1] & second[x + n.dx2];
  out[w - 1] = self[w - 1];
}

void PlainDilate(const std::uint8_t* const rows[3], std::uint8_t* out, int w,
                 const HatchNeighbours& n) {
  DilateLoop(rows, out, w, n);
}

#if defined(__x86_64__) && defined(__GNUC__)
[[gnu::target("avx2")]] void Avx2Dilate(const std::uint8_t* const rows[3], std::uint8_t* out, int w,
                                        const HatchNeighbours& n) {
  DilateLoop(rows, out, w, n);
}
#endif

using Dilate = void (*)(const std::uint8_t* const[3], std::uint8_t*, int, const HatchNeighbours&);

Dilate ChooseDilate() {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2Dilate;
#endif
  return PlainDilate;
}

// All passes at once, row by row: pass k of row y needs only pass k - 1 of rows y - 1 to y + 1,
// so each pass keeps its last three rows, and the edge map's gray values, the thresholded rows
// and every pass stay in cache; the source is read and the drawing written once, whatever the
// scope. A band writes rows y0 to y1 - 1 and thresholds the scope rows beyond them itself.
void HatchBand(const Bitmap32& source, Bitmap32& drawing, int y0, int y1, int pressure, int scope,
               const HatchNeighbours& n, Dilate dilate) {
  const int w = drawing.Width(), h = drawing.Height();
  const auto lo = [&](int k) { return std::max(0, y0 - (scope - k)); };
  const auto hi = [&](int k) { return std::min(h - 1, y1 - 1 + (scope - k)); };
  const auto width = static_cast<std::size_t>(w);
  std::vector<std::uint8_t> rings(static_cast<std::size_t>(scope + 1) * 3 * width);
  const auto slot = [&](int k, int y) {
    return rings.data() +
           (static_cast<std::size_t>(k) * 3 + static_cast<std::size_t>(y % 3)) * width;
  };
  for (int t = lo(0); t <= hi(0) + scope; ++t) {
    if (t <= hi(0)) {
      GrayEdgeCells(source, t, pressure, slot(0, t));
    }
    for (int k = 1; k <= scope; ++k) {
      const int r = t - k;
      if (r < lo(k) || r > hi(k)) continue;
      if (r == 0 || r == h - 1) {
        std::copy_n(slot(k - 1, r), width, slot(k, r));
      } else {
        const std::uint8_t* const rows[3] = {slot(k - 1, r - 1), slot(k - 1, r),
                                             slot(k - 1, r + 1)};
        dilate(rows, slot(k, r), w, n);
      }
    }
    const int r = t - scope;
    if (r >= y0 && r < y1) InkPixels(slot(scope, r), w, drawing.ScanLine(r));
  }
  EndStreamedRows();
}

}  // namespace

Bitmap32 Vuzorar(const Bitmap32& source, int pressure, int scope, HatchDirection direction) {
  const HatchNeighbours n = HatchNeighboursOf(direction);
  const int w = source.Width(), h = source.Height();
  if (h < 3 || w < 3 || scope < 1) return PenSketch(source, pressure);
  Bitmap32 drawing = ScratchPicture(w, h);
  const Dilate dilate = ChooseDilate();
  ParallelRows(
      0, h, static_cast<std::size_t>(w) * static_cast<std::size_t>(12 + scope),
      [&](int y0, int y1) { HatchBand(source, drawing, y0, y1, pressure, scope, n, dilate); });
  return drawing;
}

const EffectSpec& VuzorarEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Mono,
      .menuPosition = 3,
      .menuEntry = "Vuzorar",
      .menuObjectName = "Vuzorar1",
      .windowObjectName = "TVuzorar",
      .caption = "Vuzorar",
      .statusText = "Vuzorar",
      .cliName = "vuzorar",
      .batchTag = "Vuzorar",
      .collapsedHeight = 127,
      .expandedHeight = 205,
      .colorUp = true,
      .batchPushesHistory = true,
      .lineArtAfterApply = true,
      .params =
          {
              {.name = "vuzorar-pressure",
               .objectName = "TrackBar1",
               .captionLabel = "Label8",
               .caption = "Vuzorar Pressure:",
               .maximum = 255,
               .defaultValue = 128,
               .pageStep = 10,
               .numberLabel = "Label9",
               .initialNumber = "128",
               .help = "gray edge level at or below which a pixel is inked"},
              {.name = "scope",
               .objectName = "TrackBar2",
               .captionLabel = "Label2",
               .caption = "Scope:",
               .minimum = 1,
               .maximum = 10,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "dilation passes: each ink pixel becomes a stroke of 2 * scope + 1"},
              {.kind = ParamKind::Choice,
               .name = "direction",
               .captionLabel = "Label1",
               .caption = "Direction:",
               .defaultValue = static_cast<int>(HatchDirection::Rising),
               .options = {{"rising", "///", "RadioButton1", ""},
                           {"falling", "\\\\\\", "RadioButton2", ""},
                           {"vertical", "| | |", "RadioButton3", ""},
                           {"horizontal", "==", "RadioButton4", ""}},
               .help = "the direction of the hatching strokes",
               .resetOnShow = true},
          },
      .reference = {.hash = 0x5b8ebaf6b6b5a3a4,
                    .topLeft = 0xffffff,
                    .centre = 0xffffff,
                    .bottomRight = 0xffffff},
      .routine =
          [](const EffectInput& in) {
            return Vuzorar(in.source, in.params.GetInt("vuzorar-pressure"),
                           in.params.GetInt("scope"),
                           static_cast<HatchDirection>(in.params.GetInt("direction")));
          },
  };
  return entry;
}

}  // namespace quillane
