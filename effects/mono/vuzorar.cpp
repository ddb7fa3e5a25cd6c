// Vuzorar: the pen drawing with every ink pixel drawn out into a short hatching stroke.
#include "effects/mono/vuzorar.h"

#include <stdexcept>
#include <utility>
#include <vector>

#include "effects/mono/pen_sketch.h"
#include "effects/registry.h"
#include "imaging/edge_map.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

struct Offsets {
  int dx1, dy1, dx2, dy2;
};

Offsets NeighboursOf(HatchDirection direction) {
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

bool IsInk(const Pixel& p) {
  return p.b == 0 && p.g == 0 && p.r == 0;
}

// A thresholded picture as one byte per pixel, 0 for ink and 0xFF for paper, so that a pass
// is an AND of three shifted rows and moves a quarter of the bytes a pixel pass would.
using InkMask = std::vector<std::uint8_t>;

// One dilation pass from mask `from` into `to`; only interior cells are written, the border
// cells of both masks being equal and never changing.
void DilateMask(const InkMask& from, InkMask& to, int w, int h, const Offsets& n) {
  const auto at = [w](int x, int y) {
    return static_cast<std::size_t>(y) * static_cast<std::size_t>(w) + static_cast<std::size_t>(x);
  };
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) / 4, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const std::uint8_t* __restrict self = &from[at(1, y)];
      const std::uint8_t* __restrict first = &from[at(1 + n.dx1, y + n.dy1)];
      const std::uint8_t* __restrict second = &from[at(1 + n.dx2, y + n.dy2)];
      std::uint8_t* __restrict out = &to[at(1, y)];
      for (int x = 0; x < w - 2; ++x) out[x] = self[x] & first[x] & second[x];
    }
  });
}

}  // namespace

void BitmapDilate(TBitmap32& bitmap, HatchDirection direction) {
  const Offsets n = NeighboursOf(direction);
  const int w = bitmap.Width(), h = bitmap.Height();
  if (h - 2 < 1) return;
  const TBitmap32 snapshot = bitmap;
  for (int y = 1; y <= h - 2; ++y)
    for (int x = 1; x <= w - 2; ++x) {
      Pixel& p = bitmap.At(x, y);
      if (IsInk(p)) continue;
      if (IsInk(snapshot.At(x + n.dx1, y + n.dy1)) || IsInk(snapshot.At(x + n.dx2, y + n.dy2))) {
        p.b = p.g = p.r = 0;
      }
    }
}

TBitmap32 Vuzorar(const TBitmap32& source, int pressure, int scope, HatchDirection direction) {
  const Offsets n = NeighboursOf(direction);
  TBitmap32 drawing = source;
  picsobel(drawing);
  const int w = drawing.Width(), h = drawing.Height();
  if (h < 3 || w < 3 || scope < 1) {
    two_Value1Click(drawing, pressure);
    return drawing;
  }
  const std::size_t count = drawing.PixelCount();
  InkMask mask(count);
  ParallelRows(0, h, static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      std::uint8_t* row = &mask[static_cast<std::size_t>(y) * static_cast<std::size_t>(w)];
      GrayLevels(drawing.ScanLine(y), row, w);
      for (int x = 0; x < w; ++x) row[x] = row[x] > pressure ? 0xFF : 0;
    }
  });
  // Two masks for the whole run, the passes taking turns at reading and writing.
  InkMask other = mask;
  for (int pass = 0; pass < scope; ++pass) {
    DilateMask(mask, other, w, h, n);
    std::swap(mask, other);
  }
  ParallelRows(0, h, static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = drawing.ScanLine(y);
      const std::uint8_t* cells = &mask[static_cast<std::size_t>(y) * static_cast<std::size_t>(w)];
      for (int x = 0; x < w; ++x) row[x] = cells[x] != 0 ? kPaper : kInk;
    }
  });
  return drawing;
}

const EffectSpec& VuzorarEffect() {
  static const EffectSpec entry{
      .toolNumber = 3,
      .menu = EffectMenu::Mono,
      .menuPosition = 3,
      .menuEntry = "Vuzorar",
      .menuHandler = "Vuzorar1Click",
      .windowClass = "TVuzorar",
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
               .help = "the strokes' direction; every showing of the window resets it",
               .resetOnShow = true},
          },
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
