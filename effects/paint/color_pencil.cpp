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
namespace {

int NewLightness(int e, int l) {
  return Round(static_cast<Extended>(e) / 100 * (100 - l)) + l;
}

int EdgeTone(int gray, int pressure) {
  return LightnessContrast(RgbToHsl(gray, gray, gray).l, pressure);
}

}  // namespace

TBitmap32 colorsketch(const TBitmap32& source, int pressure) {
  TBitmap32 out = ScratchPicture(source.Width(), source.Height());
  ColorSketchInto(source, pressure, out);
  return out;
}

void ColorSketchInto(const TBitmap32& source, int pressure, TBitmap32& out) {
  // The edge map is made gray in place and then overwritten pixel by pixel with the result,
  // so the run needs no bitmap beyond it.
  if (source.Empty()) return;
  std::memcpy(out.Data(), source.Data(), source.PixelCount() * sizeof(Pixel));
  picsobel(out);
  ConvertToGray(out);

  // Both steps between the edge gray and the new lightness depend on few inputs: tables.
  std::array<std::uint8_t, 256> tone{};
  for (int g = 0; g < 256; ++g)
    tone[static_cast<std::size_t>(g)] = static_cast<std::uint8_t>(EdgeTone(g, pressure));
  static const auto lightness = [] {
    std::array<std::array<std::uint8_t, 101>, 101> t{};
    for (int e = 0; e <= 100; ++e)
      for (int l = 0; l <= 100; ++l)
        t[static_cast<std::size_t>(e)][static_cast<std::size_t>(l)] =
            static_cast<std::uint8_t>(NewLightness(e, l));
    return t;
  }();

  const HslTables& hsl = HslToRgbTables();
  const int w = out.Width();
  ParallelRows(0, out.Height(), static_cast<std::size_t>(w) * 8, [&](int y0, int y1) {
    std::vector<Hsl> colours(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      Pixel* row = out.ScanLine(y);
      RgbToHslRow(source.ScanLine(y), colours.data(), w);
      for (int x = 0; x < w; ++x) {
        const Hsl c = colours[static_cast<std::size_t>(x)];
        const std::uint8_t* light =
            hsl.lightness[lightness[tone[row[x].r]][static_cast<std::size_t>(c.l)]];
        const std::uint8_t* saturated = hsl.saturation[c.s];
        const std::uint8_t* hue = hsl.hue[c.h];
        row[x] = Pixel{light[saturated[hue[2]]], light[saturated[hue[1]]], light[saturated[hue[0]]],
                       255};
      }
    }
  });
}

TBitmap32 ColorSketchReference(const TBitmap32& source, int pressure) {
  TBitmap32 edges = source;
  picsobel(edges);
  TBitmap32 out = source;
  for (int y = 0; y < out.Height(); ++y) {
    for (int x = 0; x < out.Width(); ++x) {
      const Pixel ep = edges.At(x, y);
      const int e = EdgeTone(GrayValue(ep.r, ep.g, ep.b), pressure);
      Pixel& p = out.At(x, y);
      const Hsl hsl = RgbToHsl(p.r, p.g, p.b);
      const Rgb rgb = HslToRgb(hsl.h, hsl.s, NewLightness(e, hsl.l));
      p = Pixel{static_cast<std::uint8_t>(rgb.b), static_cast<std::uint8_t>(rgb.g),
                static_cast<std::uint8_t>(rgb.r), 255};
    }
  }
  return out;
}

const EffectSpec& ColorPencilEffect() {
  static const EffectSpec entry{
      .toolNumber = 5,
      .menu = EffectMenu::Color,
      .menuPosition = 1,
      .menuEntry = "Color Pencil",
      .menuHandler = "Colorsketch1Click",
      .windowClass = "TColor_Sketch",
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
      .routine =
          [](const EffectInput& in) {
            return colorsketch(in.source, in.params.GetInt("pressure"));
          },
  };
  return entry;
}

}  // namespace quillane
