#include "effects/paint/color_pencil.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <vector>

#include "effects/registry.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"

namespace quillane {

int ColorPencilLightness(int e, int l) {
  return Round(static_cast<Extended>(e) / 100 * (100 - l)) + l;
}

int ColorPencilEdgeTone(int gray, int pressure) {
  return LightnessContrast(RgbToHsl(gray, gray, gray).l, pressure);
}

Bitmap32 ColorPencil(const Bitmap32& source, int pressure) {
  Bitmap32 out = ScratchPicture(source.Width(), source.Height());
  ColorSketchInto(source, pressure, out);
  return out;
}

void ColorSketchInto(const Bitmap32& source, int pressure, Bitmap32& out) {
  const int w = source.Width(), h = source.Height();
  if (source.Empty()) return;
  // The new lightness depends on the edge gray and L alone: one table for the picture, its
  // rows taken from one of every tone and L, which does not depend on the pressure.
  static const auto byTone = [] {
    std::array<std::array<std::uint8_t, 101>, 101> t{};
    for (int e = 0; e <= 100; ++e)
      for (int l = 0; l <= 100; ++l)
        t[static_cast<std::size_t>(e)][static_cast<std::size_t>(l)] =
            static_cast<std::uint8_t>(ColorPencilLightness(e, l));
    return t;
  }();
  LightnessByLevel lightness;
  for (int g = 0; g < 256; ++g)
    std::memcpy(&lightness.at[static_cast<std::size_t>(g * 101)],
                byTone[static_cast<std::size_t>(ColorPencilEdgeTone(g, pressure))].data(), 101);
  const HslRowChanger changer(HslChange{});

  if (w < 3 || h < 3) {
    // No interior pixel: the edge map's border rules alone, from a whole edge map.
    Bitmap32 edges = source;
    InvertedSobelEdges(edges);
    std::vector<std::uint8_t> gray(static_cast<std::size_t>(w));
    for (int y = 0; y < h; ++y) {
      GrayLevels(edges.ScanLine(y), gray.data(), w);
      changer.RowWithLevels(source.ScanLine(y), out.ScanLine(y), w, gray.data(), lightness);
    }
    return;
  }
  // Each row's edge grays are made from three source rows just before the row is converted,
  // so the edge map never exists as a picture. Rows depend on the source alone, so threads
  // take short runs of them in turn.
  ParallelRowRuns(0, h, static_cast<std::size_t>(w) * 16, [&](int y0, int y1) {
    std::vector<std::uint8_t> gray(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      GrayEdgeRow(source, y, gray.data());
      changer.RowWithLevels(source.ScanLine(y), out.ScanLine(y), w, gray.data(), lightness);
    }
  });
}

const EffectSpec& ColorPencilEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Color,
      .menuPosition = 1,
      .menuEntry = "Color Pencil",
      .menuObjectName = "Colorsketch1",
      .windowObjectName = "TColor_Sketch",
      .caption = "Color_Pencil",
      .statusText = "Color Sketch",
      .cliName = "color-pencil",
      .batchTag = "ZidovUzivid",
      .collapsedHeight = 107,
      .expandedHeight = 184,
      .batchPushesHistory = true,
      .params =
          {
              {.name = "pressure",
               .objectName = "TrackBar1",
               .captionLabel = "Label8",
               .caption = "Pressure:",
               .maximum = 89,
               .defaultValue = 45,
               .numberLabel = "Label9",
               .initialNumber = "50",
               .numberFor = [](int p) { return Round(static_cast<Extended>(p) * 100 / 89); },
               .help = "contrast position of the edge tone: 0 white, 45 as drawn, 89 hardest"},
          },
      .reference = {.hash = 0x47ffeeb9b5b445d0,
                    .topLeft = 0xfefcfb,
                    .centre = 0xf5f5f4,
                    .bottomRight = 0xffffff},
      .routine =
          [](const EffectInput& in) {
            return ColorPencil(in.source, in.params.GetInt("pressure"));
          },
  };
  return entry;
}

}  // namespace quillane
