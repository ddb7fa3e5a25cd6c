#include "effects/surface/texture.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "data/texture_tiles.h"
#include "effects/registry.h"
#include "effects/surface/for_current.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"
#include "imaging/tone.h"

namespace quillane {

// Beyond 100 points either way every lightness ends at a limit, so the shift is kept there;
// that keeps it in 16 bits for any pressure.
int TextureLightnessShift(int tileLightness, int pressure) {
  return std::clamp(Round(static_cast<Extended>(tileLightness - 70) * pressure / 50), -100, 100);
}

namespace {

std::vector<ParamOption> TileOptions() {
  std::vector<ParamOption> options;
  for (int n = 1; n <= kTextureTiles; ++n)
    options.push_back({std::to_string(n), "", "RadioButton" + std::to_string(n), ""});
  return options;
}

}  // namespace

Bitmap32 texture(const Bitmap32& base, const Bitmap32& tile, int pressure) {
  const int w = base.Width(), h = base.Height();
  if (w == 0 || h == 0) return Bitmap32(w, h);
  const int tw = std::max(1, tile.Width()), th = std::max(1, tile.Height());
  const bool plain = tile.Width() == 0 || tile.Height() == 0;
  // One row of shifts per tile row, already repeated across the picture's width.
  const int rows = std::min(th, h);
  std::array<std::int16_t, 101> shiftOf{};  // by the tile's lightness
  for (int l = 0; l <= 100; ++l)
    shiftOf[static_cast<std::size_t>(l)] =
        static_cast<std::int16_t>(TextureLightnessShift(l, pressure));
  std::vector<std::int16_t> shifts(static_cast<std::size_t>(rows) * static_cast<std::size_t>(w));
  for (int ty = 0; ty < rows && !plain; ++ty) {
    std::int16_t* row = &shifts[static_cast<std::size_t>(ty) * static_cast<std::size_t>(w)];
    const Pixel* tileRow = tile.ScanLine(ty);
    for (int x = 0; x < std::min(tw, w); ++x)
      row[x] =
          shiftOf[static_cast<std::size_t>(RgbToHsl(tileRow[x].r, tileRow[x].g, tileRow[x].b).l)];
    for (int x = tw; x < w; ++x) row[x] = row[x - tw];
  }
  const HslRowChanger changer(HslChange{});
  return MapRows(base, 8, [&](const Pixel* in, Pixel* out, int width, int y) {
    changer.Row(in, out, width,
                &shifts[static_cast<std::size_t>(y % rows) * static_cast<std::size_t>(width)]);
  });
}

const EffectSpec& TextureEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Veins,
      .menuPosition = 2,
      .menuEntry = "Texture",
      .menuObjectName = "exture1",
      .windowObjectName = "TTexture",
      .caption = "Texture",
      .statusText = "Made texture",
      .cliName = "texture",
      .batchTag = "Texture",
      .collapsedHeight = 288,
      .expandedHeight = 368,
      .batchPushesHistory = true,
      .params =
          {
              {.kind = ParamKind::Choice,
               .name = "texture",
               .defaultValue = 4,
               .options = TileOptions(),
               .help = "the surface tile: 1 canvas, 2 paper, 3 brick, 4 stone, 5 wood, 6 twill, 7 "
                       "crackle, 8 sandstone, 9 burlap, 10 leather, 11 plaster, 12 ripples, 13 "
                       "hammered metal, 14 bark, 15 mosaic"},
              {.name = "pressure",
               .objectName = "TrackBar1",
               .caption = "Pressure:",
               .maximum = 100,
               .defaultValue = 50,
               .numberLabel = "Label9",
               .initialNumber = "50",
               .help =
                   "0 keeps the lightness, 50 moves it by the tile's lightness - 70, 100 twice"},
              ForCurrentParam(
                  "1: texture the picture as shown when the window opened; 0: the source"),
          },
      .reference = {.hash = 0xdeb5264a77da691f,
                    .topLeft = 0xba7140,
                    .centre = 0xc5c4bf,
                    .bottomRight = 0x3c9f69},
      .routine =
          [](const EffectInput& in) {
            const Bitmap32& base = ForCurrentBase(in);
            return texture(base, TextureTile(in.params.GetInt("texture")),
                           in.params.GetInt("pressure"));
          },
  };
  return entry;
}

}  // namespace quillane
