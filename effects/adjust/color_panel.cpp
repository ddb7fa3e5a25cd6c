#include "effects/adjust/color_panel.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>

#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

static_assert(std::endian::native == std::endian::little, "pixels are read as 0xAARRGGBB");
constexpr std::uint32_t kBlue = 0x000000FF, kGreen = 0x0000FF00, kRed = 0x00FF0000;

// A zone's change of a pixel: channels raised or lowered (limited to 0..255), then channels
// cleared to 0 and set to 255. Alpha is never touched.
struct Tint {
  int addR = 0, addG = 0, addB = 0;
  std::uint32_t clear = 0, set = 0;
};

constexpr Tint kFloodA{.set = kRed};
constexpr Tint kFloodB{.clear = kBlue, .set = kGreen};
constexpr Tint kFloodC{.clear = kRed, .set = kBlue};
constexpr Tint kFloodD{.set = kRed | kBlue};

inline Pixel Tinted(Pixel p, const Tint& t) {
  p.r = static_cast<std::uint8_t>(ClampByte(p.r + t.addR));
  p.g = static_cast<std::uint8_t>(ClampByte(p.g + t.addG));
  p.b = static_cast<std::uint8_t>(ClampByte(p.b + t.addB));
  const std::uint32_t word = (std::bit_cast<std::uint32_t>(p) & ~t.clear) | t.set;
  return std::bit_cast<Pixel>(word);
}

// The zone layouts: row 0 and column 0 are copied, every other pixel of row y takes the tint
// tints[zone(x)]. zoneOf(y) gives the row's zone function.
template <typename RowZones>
TBitmap32 Zoned(const TBitmap32& source, const Tint* tints, RowZones rowZones) {
  const int w = source.Width(), h = source.Height();
  TBitmap32 out(w, h);
  if (h > 0)
    std::memcpy(out.ScanLine(0), source.ScanLine(0), sizeof(Pixel) * static_cast<std::size_t>(w));
  ParallelRows(1, h, static_cast<std::size_t>(w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const Pixel* in = source.ScanLine(y);
      Pixel* row = out.ScanLine(y);
      row[0] = in[0];
      const auto zone = rowZones(y);
      for (int x = 1; x < w; ++x) row[x] = Tinted(in[x], tints[zone(x)]);
    }
  });
  return out;
}

// The last x at which pred holds, for a pred true up to some x and false after it; estimate
// lies within a step or two of the answer.
template <typename Pred>
std::int64_t LastTrue(std::int64_t estimate, Pred pred) {
  while (pred(estimate + 1)) ++estimate;
  while (!pred(estimate)) --estimate;
  return estimate;
}
// The first x at which pred holds, for a pred false up to some x and true after it.
template <typename Pred>
std::int64_t FirstTrue(std::int64_t estimate, Pred pred) {
  while (pred(estimate - 1)) --estimate;
  while (!pred(estimate)) ++estimate;
  return estimate;
}

std::int64_t Floor(Extended v) {
  return static_cast<std::int64_t>(std::floor(v));
}

TBitmap32 Panel2x2(const TBitmap32& source) {
  TBitmap32 base = source;
  TBitmap32 small = source;
  ZoomInandOut(small, 0.5L, 0.5L);
  const int w = small.Width(), h = small.Height();
  const auto put = [](Pixel& target, Pixel p, const Tint& t) {
    const Pixel q = Tinted(p, t);
    target = Pixel{q.b, q.g, q.r, target.a};
  };
  for (int y = 1; y < h; ++y) {
    const Pixel* s = small.ScanLine(y);
    Pixel* top = base.ScanLine(y);
    Pixel* bottom = base.ScanLine(h + y);
    for (int x = 1; x < w; ++x) {
      put(top[x], s[x], kFloodA);
      put(top[w + x], s[x], kFloodB);
      put(bottom[x], s[x], kFloodC);
      put(bottom[w + x], s[x], kFloodD);
    }
  }
  return base;
}

TBitmap32 Panel3x3(const TBitmap32& source) {
  static constexpr Tint kTiles[3][3] = {
      {{.set = kRed}, {.addR = -120, .addG = 120, .addB = -120}, {.set = kBlue}},
      {{.addR = -80, .addG = 60, .set = kBlue}, {.addR = 120, .addG = 60}, {.set = kRed | kBlue}},
      {{.addR = 80, .addB = 80, .clear = kGreen},
       {.addG = 80, .addB = 80, .clear = kRed},
       {.addR = 80, .addG = 80, .clear = kBlue}},
  };
  TBitmap32 small = source;
  ZoomInandOut(small, 1.0L / 3, 1.0L / 3);
  if (small.Empty()) return TBitmap32();
  const int w = small.Width(), h = small.Height();
  TBitmap32 out(3 * w, 3 * h);
  ParallelRows(0, 3 * h, static_cast<std::size_t>(3 * w), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const Pixel* s = small.ScanLine(y % h);
      Pixel* row = out.ScanLine(y);
      for (int c = 0; c < 3; ++c)
        for (int x = 0; x < w; ++x) {
          Pixel p = Tinted(s[x], kTiles[y / h][c]);
          p.a = 0;
          row[c * w + x] = p;
        }
    }
  });
  return out;
}

TBitmap32 Pane2x2(const TBitmap32& source) {
  static constexpr Tint kZones[4] = {kFloodA, kFloodC, kFloodB, kFloodD};
  const int w = source.Width(), h = source.Height();
  return Zoned(source, kZones, [w, h](int y) {
    const int row = 2 * y < h ? 0 : 2;
    return [w, row](int x) { return row + (2 * x < w ? 0 : 1); };
  });
}

TBitmap32 Pane3x3(const TBitmap32& source) {
  // By zone row, then zone column.
  static constexpr Tint kZones[9] = {
      {.set = kRed},
      {.addB = 50, .set = kGreen},
      {.set = kBlue},
      {.addR = 100, .set = kGreen},
      {.addG = 50, .set = kBlue},
      {.set = kGreen},
      {.set = kBlue | kRed},
      {.set = kBlue | kGreen},
      {.set = kRed},
  };
  const int w = source.Width(), h = source.Height();
  const auto third = [](int v, int size) {
    return 3 * v <= size ? 0 : (3 * v <= 2 * size ? 1 : 2);
  };
  return Zoned(source, kZones, [w, h, third](int y) {
    const int row = 3 * third(y, h);
    return [w, row, third](int x) { return row + third(x, w); };
  });
}

// Zone numbers of the catercorner triangles: bit 1 lower-left of the main diagonal, bit 0
// right of the anti-diagonal.
constexpr Tint kTriangles[4] = {kFloodA, kFloodB, kFloodC, kFloodD};

TBitmap32 Catercorner4(const TBitmap32& source) {
  const int w = source.Width(), h = source.Height();
  return Zoned(source, kTriangles, [w, h](int y) {
    const Extended diagonal = (static_cast<Extended>(w) / h) * y;
    const std::int64_t lastLower = Floor(diagonal);
    const Extended anti = static_cast<Extended>(std::int64_t{w} * (h - y)) / h;
    const std::int64_t firstRight =
        FirstTrue(Floor(anti), [&](std::int64_t x) { return x >= anti; });
    return [lastLower, firstRight](int x) {
      return (x <= lastLower ? 2 : 0) + (x >= firstRight ? 1 : 0);
    };
  });
}

TBitmap32 Catercorner16(const TBitmap32& source) {
  const int w = source.Width(), h = source.Height();
  const Extended halfW = static_cast<Extended>(w) / 2, halfH = static_cast<Extended>(h) / 2;
  const Extended slope = static_cast<Extended>(w) / h;
  return Zoned(source, kTriangles, [=](int y) {
    const bool top = y <= halfH;
    const Extended v = top ? static_cast<Extended>(y) : y - halfH;
    const Extended diagonal = slope * v;
    // Left quadrant: x <= diagonal; right one: x - W/2 <= diagonal.
    const std::int64_t leftLastLower = Floor(diagonal);
    const std::int64_t rightLastLower =
        LastTrue(Floor(diagonal + halfW), [&](std::int64_t x) { return x - halfW <= diagonal; });
    const Extended farSide = static_cast<Extended>(std::int64_t{w} * (h - y)) / h;
    const Extended leftAnti = top ? (halfH - y) * w / h : farSide;
    const std::int64_t leftFirstRight =
        FirstTrue(Floor(leftAnti), [&](std::int64_t x) { return x >= leftAnti; });
    const std::int64_t rightFirstRight =
        top ? FirstTrue(Floor(farSide), [&](std::int64_t x) { return x >= farSide; })
            : FirstTrue(Floor(farSide + halfW),
                        [&](std::int64_t x) { return x - halfW >= farSide; });
    return [=](int x) {
      const bool left = x <= halfW;
      const std::int64_t lastLower = left ? leftLastLower : rightLastLower;
      const std::int64_t firstRight = left ? leftFirstRight : rightFirstRight;
      return (x <= lastLower ? 2 : 0) + (x >= firstRight ? 1 : 0);
    };
  });
}

}  // namespace

TBitmap32 ColorPanel(const TBitmap32& source, PanelLayout layout) {
  switch (layout) {
    case PanelLayout::Panel2x2:
      return Panel2x2(source);
    case PanelLayout::Panel3x3:
      return Panel3x3(source);
    case PanelLayout::Pane2x2:
      return Pane2x2(source);
    case PanelLayout::Pane3x3:
      return Pane3x3(source);
    case PanelLayout::Catercorner4:
      return Catercorner4(source);
    case PanelLayout::Catercorner16:
      return Catercorner16(source);
  }
  return source;
}

const EffectSpec& ColorPanelEffect() {
  static const EffectSpec entry{
      .toolNumber = 13,
      .menu = EffectMenu::Adjust,
      .menuPosition = 1,
      .menuEntry = "Color panel",
      .menuHandler = "Colorpanel1Click",
      .windowClass = "TColor_Panel",
      .caption = "Color_Panel",
      .statusText = "Color Panels",
      .cliName = "color-panel",
      // Each layout button applies when it becomes selected; there is no OK.
      .apply = {},
      .params =
          {
              {.kind = ParamKind::Choice,
               .name = "layout",
               .defaultValue = static_cast<int>(PanelLayout::Panel2x2),
               .options = {{"panel-2x2", "Panel 2 x 2", "RadioButton1", ""},
                           {"panel-3x3", "Panel 3 x 3", "RadioButton4", ""},
                           {"pane-2x2", "Pane 2 x 2", "RadioButton2", ""},
                           {"pane-3x3", "Pane 3 x 3", "RadioButton5", ""},
                           {"catercorner-4", "Catercorner (4)", "RadioButton3", ""},
                           {"catercorner-16", "Catercorner (16)", "RadioButton6", ""}},
               .help = "how the picture is divided into tinted zones"},
          },
      .routine =
          [](const EffectInput& in) {
            return ColorPanel(in.source, static_cast<PanelLayout>(in.params.GetInt("layout")));
          },
  };
  return entry;
}

}  // namespace quillane
