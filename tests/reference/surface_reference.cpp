#include "tests/reference/surface_reference.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "effects/surface/stria.h"
#include "effects/surface/texture.h"
#include "imaging/numeric.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

// DrawOver of one overlay pixel o (alpha 1..254 or 255) onto t, for targets that are not
// opaque; opaque targets take the tables below.
void CompositeOver(Pixel o, Pixel& t) {
  if (t.a == 0 || o.a == 255) {
    t = o;
    return;
  }
  const std::uint32_t at = t.a, ao = o.a;
  const std::uint32_t d = 255 * (ao + at) - ao * at;
  const std::uint32_t wt = at * (255 - ao);
  const std::uint32_t wo = 255 * ao;
  t.b = static_cast<std::uint8_t>((wt * t.b + wo * o.b) / d);
  t.g = static_cast<std::uint8_t>((wt * t.g + wo * o.g) / d);
  t.r = static_cast<std::uint8_t>((wt * t.r + wo * o.r) / d);
  t.a = static_cast<std::uint8_t>(d / 255);
}

// The stripe colour over an opaque pixel, channel by channel: DrawOver's quotient with
// target alpha 255 reduces to ((255 - a) t + a c) div 255.
struct OpaqueMix {
  std::array<std::uint8_t, 256> b, g, r;
};

OpaqueMix MixTables(Pixel o) {
  OpaqueMix mix{};
  for (int t = 0; t < 256; ++t) {
    const auto blend = [&](int c) {
      return static_cast<std::uint8_t>(((255 - o.a) * t + o.a * c) / 255);
    };
    mix.b[static_cast<std::size_t>(t)] = blend(o.b);
    mix.g[static_cast<std::size_t>(t)] = blend(o.g);
    mix.r[static_cast<std::size_t>(t)] = blend(o.r);
  }
  return mix;
}

}  // namespace

Bitmap32 EmbossReference(const Bitmap32& source, int lighting, int depth) {
  Bitmap32 out = source;
  for (int y = 0; y < source.Height() - depth; ++y)
    for (int x = 0; x < source.Width() - depth; ++x) {
      const Pixel p = source.At(x, y);
      const Pixel q = source.At(x + depth, y + depth);
      const auto v = [&](int pc, int qc) {
        return std::min(255, std::abs(pc - qc + lighting + 50));
      };
      const std::uint8_t g = GrayValue(v(p.r, q.r), v(p.g, q.g), v(p.b, q.b));
      out.At(x, y) = Pixel{g, g, g, 255};
    }
  return out;
}

Bitmap32 StriaReference(const Bitmap32& base, int layerWidth, int layerHeight,
                        StriaDirection direction, int thickness, int space, int transparency,
                        std::uint32_t colour) {
  Bitmap32 out = base;
  const int w = std::min(base.Width(), std::max(0, layerWidth));
  const int h = std::min(base.Height(), std::max(0, layerHeight));
  if (w == 0 || h == 0) return out;
  const int period = std::max(1, thickness + space);
  const Pixel o = StripeColour(colour, transparency);
  const OpaqueMix mix = MixTables(o);
  std::vector<std::uint8_t> stripeColumn(static_cast<std::size_t>(w), 1);
  if (direction == StriaDirection::Vertical)
    for (int x = 0; x < w; ++x) stripeColumn[static_cast<std::size_t>(x)] = x % period < thickness;
  for (int y = 0; y < h; ++y) {
    Pixel* row = out.ScanLine(y);
    const bool stripeRow = direction == StriaDirection::Vertical || y % period < thickness;
    for (int x = 0; x < w; ++x) {
      Pixel& t = row[x];
      if (stripeRow && stripeColumn[static_cast<std::size_t>(x)] && o.a != 0) {
        if (t.a == 255)
          t = Pixel{mix.b[t.b], mix.g[t.g], mix.r[t.r], 255};
        else
          CompositeOver(o, t);
      } else if (t.a == 0) {
        t = Pixel{255, 255, 255, 0};  // a transparent overlay pixel over a transparent one
      }
    }
  }
  return out;
}

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
