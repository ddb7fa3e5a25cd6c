#include "effects/surface/stria.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <vector>

#include "effects/registry.h"
#include "effects/surface/for_current.h"
#include "imaging/colour_rows.h"
#include "imaging/numeric.h"
#include "imaging/row_pass.h"

namespace quillane {

Pixel StripeColour(std::uint32_t colour, int transparency) {
  return PixelFromColorRef(colour, static_cast<std::uint8_t>(255 - ClampByte(transparency)));
}

// One pass from base into the result: each row of the layer through StripeRow with the mask of
// its stripe columns (none on a gap row, or when the colour is fully transparent), the rest of
// the row and the rows below the layer copied.
Bitmap32 stria(const Bitmap32& base, int layerWidth, int layerHeight, StriaDirection direction,
               int thickness, int space, int transparency, std::uint32_t colour) {
  const int w = std::min(base.Width(), std::max(0, layerWidth));
  const int h = std::min(base.Height(), std::max(0, layerHeight));
  if (w == 0 || h == 0) return base;
  const int period = std::max(1, thickness + space);
  const Pixel o = StripeColour(colour, transparency);
  std::vector<std::uint32_t> stripes(static_cast<std::size_t>(w), o.a != 0 ? ~0u : 0u);
  if (direction == StriaDirection::Vertical && o.a != 0)
    for (int x = 0; x < w; ++x)
      stripes[static_cast<std::size_t>(x)] = x % period < thickness ? ~0u : 0u;
  const std::vector<std::uint32_t> gaps(static_cast<std::size_t>(w), 0u);
  return MapRows(base, 1, [&](const Pixel* in, Pixel* out, int width, int y) {
    int x0 = 0;
    if (y < h) {
      const bool stripeRow = direction == StriaDirection::Vertical || y % period < thickness;
      StripeRow(in, out, w, (stripeRow ? stripes : gaps).data(), o);
      x0 = w;
    }
    if (width > x0)
      std::memcpy(out + x0, in + x0, sizeof(Pixel) * static_cast<std::size_t>(width - x0));
  });
}

const EffectSpec& StriaEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Veins,
      .menuPosition = 3,
      .menuEntry = "Stria",
      .menuObjectName = "Verticalstria1",
      .windowObjectName = "TStria",
      .caption = "Stria",
      .statusText = "Added stria",
      .cliName = "stria",
      .batchTag = "Stria",
      .collapsedHeight = 159,
      .expandedHeight = 240,
      .batchPushesHistory = true,
      .params =
          {
              {.kind = ParamKind::Choice,
               .name = "direction",
               .defaultValue = static_cast<int>(StriaDirection::Vertical),
               .options = {{"vertical", "Vertical", "RadioButton1", ""},
                           {"horizontal", "Horizontal", "RadioButton2", ""}},
               .help = "stripes down the picture or across it"},
              {.name = "thickness",
               .objectName = "TrackBar3",
               .caption = "Thickness:",
               .minimum = 1,
               .maximum = 100,
               .defaultValue = 1,
               .numberLabel = "Label3",
               .initialNumber = "1",
               .help = "stripe width in pixels"},
              {.name = "space",
               .objectName = "TrackBar2",
               .caption = "Space:",
               .minimum = 1,
               .maximum = 255,
               .defaultValue = 2,
               .numberLabel = "Label4",
               .initialNumber = "2",
               .help = "gap between stripes in pixels"},
              {.name = "transparent",
               .objectName = "TrackBar1",
               .caption = "Transparent:",
               .maximum = 255,
               .defaultValue = 128,
               .pageStep = 10,
               .numberLabel = "Label9",
               .initialNumber = "50",
               .numberFor = [](int t) { return Round(static_cast<Extended>(t) * 100 / 255); },
               .help = "0 paints the stripes solid, 255 leaves the picture as it is"},
              {.kind = ParamKind::Colour,
               .name = "color",
               .objectName = "ColorPanel",
               .defaultValue = 0x000000,
               .hint = "Select a color for stria",
               .help = "stripe colour"},
              ForCurrentParam(
                  "1: stripe the picture as shown when the window opened; 0: the source"),
          },
      .reference = {.hash = 0x63d58d2b0864063c,
                    .topLeft = 0x442917,
                    .centre = 0x97968c,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            const Bitmap32& base = ForCurrentBase(in);
            return stria(base, in.source.Width(), in.source.Height(),
                         static_cast<StriaDirection>(in.params.GetInt("direction")),
                         in.params.GetInt("thickness"), in.params.GetInt("space"),
                         in.params.GetInt("transparent"),
                         static_cast<std::uint32_t>(in.params.Get("color")));
          },
  };
  return entry;
}

}  // namespace quillane
