// Pen sketch: the edge map thresholded to black ink on white paper.
#include "effects/mono/pen_sketch.h"

#include <vector>

#include "effects/registry.h"
#include "imaging/edge_map.h"
#include "imaging/ink_rows.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"

namespace quillane {

void ThresholdToInk(Bitmap32& bitmap, int level) {
  const int w = bitmap.Width();
  ParallelRows(0, bitmap.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    // One row of gray values at a time, so the picture is read and written in a single pass.
    std::vector<std::uint8_t> gray(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      Pixel* row = bitmap.ScanLine(y);
      GrayLevels(row, gray.data(), w);
      for (int x = 0; x < w; ++x)
        row[x] = gray[static_cast<std::size_t>(x)] > level ? kPaper : kInk;
    }
  });
}

Bitmap32 PenSketch(const Bitmap32& source, int pressure) {
  const int w = source.Width(), h = source.Height();
  if (w < 3 || h < 3) {
    // No interior pixel: the border rules alone, the plain way.
    Bitmap32 drawing = source;
    InvertedSobelEdges(drawing);
    ThresholdToInk(drawing, pressure);
    return drawing;
  }
  Bitmap32 drawing = ScratchPicture(w, h);
  ParallelRows(0, h, static_cast<std::size_t>(w) * 12, [&](int y0, int y1) {
    std::vector<std::uint8_t> cells(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      GrayEdgeCells(source, y, pressure, cells.data());
      InkPixels(cells.data(), w, drawing.ScanLine(y));
    }
    EndStreamedRows();
  });
  return drawing;
}

const EffectSpec& PenSketchEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Mono,
      .menuPosition = 2,
      .menuEntry = "Pen sketch",
      .menuObjectName = "Pensketch1",
      .windowObjectName = "TPen_Sketch",
      .caption = "Pen_Sketch",
      .statusText = "Pen Sketch",
      .cliName = "pen-sketch",
      .batchTag = "PenSketch",
      .collapsedHeight = 108,
      .expandedHeight = 184,
      .colorUp = true,
      .batchPushesHistory = true,
      .lineArtAfterApply = true,
      .params =
          {
              {.name = "pen-pressure",
               .objectName = "TrackBar1",
               .captionLabel = "Label8",
               .caption = "Pen Pressure:",
               .maximum = 255,
               .defaultValue = 128,
               .numberLabel = "Label9",
               .initialNumber = "128",
               .help = "gray edge level at or below which a pixel is inked"},
          },
      .reference = {.hash = 0xedfda84988e366d5,
                    .topLeft = 0xffffff,
                    .centre = 0xffffff,
                    .bottomRight = 0xffffff},
      .routine =
          [](const EffectInput& in) {
            return PenSketch(in.source, in.params.GetInt("pen-pressure"));
          },
  };
  return entry;
}

}  // namespace quillane
