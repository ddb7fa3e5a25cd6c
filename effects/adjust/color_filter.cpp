// Colour filter: a gray picture seen through a strong colour filter.
#include "effects/adjust/color_filter.h"

#include <bit>

#include "effects/registry.h"
#include "imaging/gray_row.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"

namespace quillane {

std::uint32_t ColorFilterRaisedChannels(ColorFilterKind kind) {
  const int k = static_cast<int>(kind);
  const bool red = k == 1 || k == 4 || k == 6;
  const bool green = k == 2 || k == 4 || k == 5;
  const bool blue = k == 3 || k == 5 || k == 6;
  return (red ? 0x00FF0000u : 0u) | (green ? 0x0000FF00u : 0u) | (blue ? 0x000000FFu : 0u);
}

Bitmap32 ColorFilter(const Bitmap32& base, ColorFilterKind kind) {
  const std::uint32_t set = ColorFilterRaisedChannels(kind);
  return MapRows(base, 1,
                 [set](const Pixel* in, Pixel* out, int w, int) { GrayRowInto(in, out, w, set); });
}

const EffectSpec& ColorFilterEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Adjust,
      .menuPosition = 3,
      .menuEntry = "Color Filter",
      .menuObjectName = "ColorFilter2",
      .windowObjectName = "TColor_Filter",
      .caption = "Color_Filter",
      .statusText = "Color Filter",
      .cliName = "color-filter",
      .params =
          {
              {.kind = ParamKind::Choice,
               .name = "filter",
               .defaultValue = static_cast<int>(ColorFilterKind::Red),
               .options = {{"red", "", "Panel3", "Red"},
                           {"green", "", "Panel4", "Green"},
                           {"blue", "", "Panel5", "Blue"},
                           {"yellow", "", "Panel6", "Yellow"},
                           {"cyan", "", "Panel7", "Cyan"},
                           {"purple", "", "Panel8", "Purple"}},
               .help = "the colour the gray picture is seen through"},
              {.kind = ParamKind::Switch,
               .name = "for-current",
               .objectName = "CheckBox1",
               .caption = "For current",
               .maximum = 1,
               .help = "1: filter the picture as shown; 0: the source",
               .resetOnShow = true},
          },
      .reference = {.hash = 0xdadfc27f50184b9b,
                    .topLeft = 0x4d4dff,
                    .centre = 0x9393ff,
                    .bottomRight = 0x3d3dff},
      .routine =
          [](const EffectInput& in) {
            return ColorFilter(in.params.GetInt("for-current") != 0 ? in.working : in.source,
                               static_cast<ColorFilterKind>(in.params.GetInt("filter")));
          },
  };
  return entry;
}

}  // namespace quillane
