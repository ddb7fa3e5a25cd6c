#include "tests/reference/surface_reference.h"

#include <algorithm>

#include "effects/surface/texture.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {

Bitmap32 TextureReference(const Bitmap32& base, const Bitmap32& tile, int pressure) {
  Bitmap32 out(base.Width(), base.Height());
  const bool plain = tile.Width() == 0 || tile.Height() == 0;
  for (int y = 0; y < base.Height(); ++y)
    for (int x = 0; x < base.Width(); ++x) {
      const Pixel b = base.At(x, y);
      const Hsl hsl = RgbToHslReference(b.r, b.g, b.b);
      const Pixel t = plain ? Pixel{} : tile.At(x % tile.Width(), y % tile.Height());
      const Hsl lt = RgbToHslReference(t.r, t.g, t.b);
      const int shift = plain ? 0 : TextureLightnessShift(lt.l, pressure);
      const Rgb c = HslToRgbReference(hsl.h, hsl.s, std::clamp(hsl.l + shift, 0, 100));
      out.At(x, y) = Pixel{static_cast<std::uint8_t>(c.b), static_cast<std::uint8_t>(c.g),
                           static_cast<std::uint8_t>(c.r), 255};
    }
  return out;
}

}  // namespace quillane
