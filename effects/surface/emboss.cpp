#include "effects/surface/emboss.h"

#include <cstdint>

#include "effects/registry.h"
#include "imaging/parallel.h"
#include "imaging/tone.h"

namespace quillane {
TBitmap32 emboss(const TBitmap32& source, int lighting, int depth) {
  TBitmap32 out = source;
  const int w = source.Width() - depth;
  const int h = source.Height() - depth;
  if (depth < 1 || w <= 0 || h <= 0) return out;
  const int offset = lighting + 50;
  // Every Q is read from the untouched source, so rows can be done in any order; the result is
  // the one a top-to-bottom pass in place gives.
  ParallelRows(0, h, static_cast<std::size_t>(w) * 2, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      // Byte by byte, alpha included: the gray step overwrites alpha anyway, and a plain byte
      // loop is one the compiler can widen.
      const auto* p = reinterpret_cast<const std::uint8_t*>(source.ScanLine(y));
      const auto* q = reinterpret_cast<const std::uint8_t*>(source.ScanLine(y + depth) + depth);
      Pixel* row = out.ScanLine(y);
      auto* v = reinterpret_cast<std::uint8_t*>(row);
      // Locals, so that the byte stores cannot be taken to change them and the loop widens.
      const int bytes = 4 * w, lift = offset;
      for (int i = 0; i < bytes; ++i) {
        const int d = p[i] - q[i] + lift;
        const int a = d < 0 ? -d : d;
        v[i] = static_cast<std::uint8_t>(a > 255 ? 255 : a);
      }
      ConvertRowToGray(row, w);
    }
  });
  return out;
}

const EffectSpec& EmbossEffect() {
  static const EffectSpec entry{
      .toolNumber = 15,
      .menu = EffectMenu::Veins,
      .menuPosition = 1,
      .menuEntry = "Emboss",
      .menuHandler = "Emboss1Click",
      .windowClass = "TEmboss",
      .caption = "Emboss",
      .statusText = "Emboss",
      .cliName = "emboss",
      .batchTag = "Emboss",
      .collapsedHeight = 103,
      .expandedHeight = 184,
      .batchPushesHistory = true,
      .apply = {"Button2", "OK", ""},
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              {.name = "lighting",
               .objectName = "TrackBar1",
               .caption = "Lighting:",
               .maximum = 200,
               .defaultValue = 100,
               .pageStep = 10,
               .numberLabel = "Label9",
               .initialNumber = "100",
               .help = "offset added to each difference; flat areas become gray 50 + lighting"},
              {.name = "depth",
               .objectName = "TrackBar2",
               .caption = "Depth:",
               .minimum = 1,
               .maximum = 5,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "distance to the neighbour compared, down and to the right"},
          },
      .routine =
          [](const EffectInput& in) {
            return emboss(in.source, in.params.GetInt("lighting"), in.params.GetInt("depth"));
          },
  };
  return entry;
}

}  // namespace quillane
