#include "effects/adjust/hsl_adjust.h"

#include <algorithm>

#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"

namespace quillane {

Bitmap32 HslAdjust(const Bitmap32& source, int hue, int saturation, int lighting) {
  HslChange change;
  change.hueTurn = (hue % 360 + 180) % 360;
  change.saturationShift = std::clamp(saturation, 0, 200) - 100;  // beyond, all S are 0 or 100
  change.lightnessShift = std::clamp(lighting, 0, 200) - 100;
  const HslRowChanger changer(change);
  return MapRows(source, 8,
                 [&](const Pixel* in, Pixel* out, int w, int) { changer.Row(in, out, w); });
}

const EffectSpec& HslAdjustEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Adjust,
      .menuPosition = 2,
      .menuEntry = "HSL adjust",
      .menuObjectName = "HSLadjust1",
      .windowObjectName = "THSL_Adjust",
      .caption = "HSL_Adjust",
      .statusText = "HSL Adjusted",
      .cliName = "hsl-adjust",
      .params =
          {
              {.name = "hue",
               .objectName = "TrackBar1",
               .caption = "Hue:",
               .maximum = 360,
               .defaultValue = 180,
               .numberLabel = "Label4",
               .initialNumber = "0",
               .numberFor = [](int h) { return Round(static_cast<Extended>(h - 180) * 100 / 180); },
               .help = "hue turned by position - 180 degrees; 180 neutral",
               .resetOnShow = true},
              {.name = "saturation",
               .objectName = "TrackBar2",
               .caption = "Saturation:",
               .maximum = 200,
               .defaultValue = 100,
               .numberLabel = "Label3",
               .initialNumber = "0",
               .numberFor = [](int s) { return s - 100; },
               .help = "saturation moved by position - 100 percent; 100 neutral",
               .resetOnShow = true},
              {.name = "lighting",
               .objectName = "TrackBar3",
               .caption = "Lighting:",
               .maximum = 200,
               .defaultValue = 100,
               .numberLabel = "Label9",
               .initialNumber = "0",
               .numberFor = [](int l) { return l - 100; },
               .help = "lightness moved by position - 100 percent; 100 neutral",
               .resetOnShow = true},
          },
      .reference = {.hash = 0xefd517a0fc12dbf8,
                    .topLeft = 0x89532f,
                    .centre = 0x97968d,
                    .bottomRight = 0x1c4a31},
      .routine =
          [](const EffectInput& in) {
            return HslAdjust(in.source, in.params.GetInt("hue"), in.params.GetInt("saturation"),
                             in.params.GetInt("lighting"));
          },
  };
  return entry;
}

}  // namespace quillane
