// Colour variety: the colour balance shifted step by step by swatch clicks.
#include "effects/adjust/color_variety.h"

#include <algorithm>
#include <array>

#include "effects/registry.h"
#include "imaging/row_pass.h"

namespace quillane {
namespace {

// The raise of each channel, 10 per click of a swatch naming it, capped where any byte is full.
Bitmap32 Raised(const Bitmap32& picture, int red, int green, int blue) {
  std::array<std::array<std::uint8_t, 256>, 3> up{};  // b, g, r
  const int raise[3] = {std::min(blue, 255), std::min(green, 255), std::min(red, 255)};
  for (int c = 0; c < 3; ++c)
    for (int v = 0; v < 256; ++v)
      up[static_cast<std::size_t>(c)][static_cast<std::size_t>(v)] =
          static_cast<std::uint8_t>(std::min(255, v + raise[c]));
  // One pass from the picture's rows into the result's, not a copy changed in place.
  return MapRows(picture, 1, [&up](const Pixel* in, Pixel* out, int w, int) {
    for (int x = 0; x < w; ++x) out[x] = Pixel{up[0][in[x].b], up[1][in[x].g], up[2][in[x].r], 255};
  });
}

bool Names(int swatch, int channel) {  // channel 0 red, 1 green, 2 blue
  static constexpr bool kChannels[7][3] = {
      {false, false, false}, {true, false, false}, {false, true, false}, {false, false, true},
      {true, true, false},   {false, true, true},  {true, false, true}};
  return swatch >= 1 && swatch <= 6 && kChannels[swatch][channel];
}

}  // namespace

Bitmap32 variety(const Bitmap32& picture, int swatch) {
  return Raised(picture, Names(swatch, 0) ? 10 : 0, Names(swatch, 1) ? 10 : 0,
                Names(swatch, 2) ? 10 : 0);
}

Bitmap32 VarietyClicks(const Bitmap32& base, const std::vector<std::int64_t>& clicks) {
  if (clicks.empty()) return base;
  int raise[3] = {0, 0, 0};
  for (const std::int64_t click : clicks)
    for (int c = 0; c < 3; ++c)
      if (Names(static_cast<int>(click), c)) raise[c] = std::min(raise[c] + 10, 255);
  return Raised(base, raise[0], raise[1], raise[2]);
}

const EffectSpec& ColorVarietyEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Adjust,
      .menuPosition = 4,
      .menuEntry = "Color variety",
      .menuObjectName = "Colorvariety1",
      .windowObjectName = "TColor_variety",
      .caption = "Color_variety",
      .statusText = "Color Varied",
      .cliName = "color-variety",
      .params =
          {
              {.kind = ParamKind::Clicks,
               .name = "more",
               .options = {{"red", "", "Panel3", "More red"},
                           {"green", "", "Panel4", "More green"},
                           {"blue", "", "Panel5", "More blue"},
                           {"yellow", "", "Panel6", "More yellow"},
                           {"cyan", "", "Panel7", "More cyan"},
                           {"purple", "", "Panel8", "More purple"}},
               .help = "swatch clicks in order; each raises its channels by 10"},
              {.kind = ParamKind::Switch,
               .name = "for-current",
               .objectName = "CheckBox1",
               .caption = "For current",
               .maximum = 1,
               .help = "1: start from the picture as shown; 0: the source",
               .resetOnShow = true},
          },
      .reference = {.hash = 0x2847434fb20bf9df,
                    .topLeft = 0x88522e,
                    .centre = 0x97968c,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            return VarietyClicks(in.params.GetInt("for-current") != 0 ? in.working : in.source,
                                 in.params.GetList("more"));
          },
  };
  return entry;
}

}  // namespace quillane
