// Colour filter: a gray picture seen through a strong colour filter.
#include "effects/adjust/color_filter.h"

#include "effects/registry.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"

namespace quillane {

TBitmap32 filter(const TBitmap32& base, ColorFilterKind kind) {
  const int k = static_cast<int>(kind);
  const bool red = k == 1 || k == 4 || k == 6;
  const bool green = k == 2 || k == 4 || k == 5;
  const bool blue = k == 3 || k == 5 || k == 6;
  TBitmap32 out = base;
  const int w = out.Width();
  ParallelRows(0, out.Height(), static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      Pixel* row = out.ScanLine(y);
      ConvertRowToGray(row, w);
      const std::uint8_t r = red ? 255 : 0, g = green ? 255 : 0, b = blue ? 255 : 0;
      const int n = w;
      for (int x = 0; x < n; ++x)
        row[x] =
            Pixel{static_cast<std::uint8_t>(row[x].b | b), static_cast<std::uint8_t>(row[x].g | g),
                  static_cast<std::uint8_t>(row[x].r | r), 255};
    }
  });
  return out;
}

const EffectSpec& ColorFilterEffect() {
  static const EffectSpec entry{
      .toolNumber = 16,
      .menu = EffectMenu::Adjust,
      .menuPosition = 3,
      .menuEntry = "Color Filter",
      .menuHandler = "ColorFilter2Click",
      .windowClass = "TColor_Filter",
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
      .routine =
          [](const EffectInput& in) {
            return filter(in.params.GetInt("for-current") != 0 ? in.working : in.source,
                          static_cast<ColorFilterKind>(in.params.GetInt("filter")));
          },
  };
  return entry;
}

}  // namespace quillane
