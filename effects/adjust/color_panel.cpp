#include "effects/adjust/color_panel.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "effects/registry.h"
#include "imaging/colour_rows.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"
#include "imaging/row_pass.h"

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

// The same change for the row kernels: a raise or a lowering per channel.
ChannelTint ChannelTintOf(const Tint& t) {
  ChannelTint c{.clear = t.clear, .set = t.set};
  const int adds[3] = {t.addB, t.addG, t.addR};
  for (int i = 0; i < 3; ++i) {
    const auto amount = static_cast<std::uint32_t>(std::min(std::abs(adds[i]), 255)) << (8 * i);
    (adds[i] > 0 ? c.add : c.sub) |= amount;
  }
  return c;
}

inline Pixel Tinted(Pixel p, const Tint& t) {
  p.r = static_cast<std::uint8_t>(ClampByte(p.r + t.addR));
  p.g = static_cast<std::uint8_t>(ClampByte(p.g + t.addG));
  p.b = static_cast<std::uint8_t>(ClampByte(p.b + t.addB));
  const std::uint32_t word = (std::bit_cast<std::uint32_t>(p) & ~t.clear) | t.set;
  return std::bit_cast<Pixel>(word);
}

// The zone layouts: row 0 and column 0 are copied, every other pixel of row y takes the tint
// tints[zone(x)], where zone = rowZones(y, cuts) is the row's zone function. The zone changes
// only at the x that rowZones adds to cuts (when cuts is given), so the fast pass tints whole
// runs between them; the plain form asks the zone of every pixel (ColorPanelZone).
struct Cuts {
  std::int64_t at[8] = {};
  int count = 0;
  void Add(std::int64_t x) { at[count++] = x; }
};

template <std::size_t kZones, typename RowZones>
Bitmap32 Zoned(const Bitmap32& source, const Tint (&tints)[kZones], RowZones rowZones) {
  ChannelTint channelTints[kZones];
  for (std::size_t i = 0; i < kZones; ++i) channelTints[i] = ChannelTintOf(tints[i]);
  return MapRows(source, 1, [&](const Pixel* in, Pixel* row, int w, int y) {
    if (w == 0) return;
    if (y == 0) {
      std::memcpy(row, in, sizeof(Pixel) * static_cast<std::size_t>(w));
      return;
    }
    row[0] = in[0];
    Cuts cuts;
    const auto zone = rowZones(y, &cuts);
    cuts.Add(w);
    for (int i = 0; i < cuts.count; ++i) cuts.at[i] = std::clamp<std::int64_t>(cuts.at[i], 1, w);
    std::sort(cuts.at, cuts.at + cuts.count);
    int x = 1;
    for (int i = 0; i < cuts.count; ++i) {
      const int end = static_cast<int>(cuts.at[i]);
      if (end <= x) continue;
      TintRow(in + x, 1, nullptr, row + x, end - x, channelTints[zone(x)]);
      x = end;
    }
  });
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

// The half-size copy is w = W div 2 by h = H div 2, and its pixel (x, y) is the source's
// (x W div w, y H div h) = (2x, 2y): with W = 2w + e (e 0 or 1) and x < w, x W div w is
// 2x + e x div w = 2x. So each band reads it straight from the source's even rows, and makes
// the top and the bottom row that share one together.
Bitmap32 Panel2x2(const Bitmap32& source) {
  const int width = source.Width(), height = source.Height();
  const int w = width / 2, h = height / 2;
  Bitmap32 out = ScratchPicture(width, height);
  const auto copyRow = [&](int y) {
    std::memcpy(out.ScanLine(y), source.ScanLine(y),
                sizeof(Pixel) * static_cast<std::size_t>(width));
  };
  const auto copy = [](const Pixel* in, Pixel* row, int x0, int x1) {
    if (x1 > x0) std::memcpy(row + x0, in + x0, sizeof(Pixel) * static_cast<std::size_t>(x1 - x0));
  };
  const ChannelTint a = ChannelTintOf(kFloodA), b = ChannelTintOf(kFloodB),
                    c = ChannelTintOf(kFloodC), d = ChannelTintOf(kFloodD);
  const auto flood = [&](int y, const Pixel* small, const ChannelTint& left,
                         const ChannelTint& right) {
    const Pixel* in = source.ScanLine(y);
    Pixel* row = out.ScanLine(y);
    copy(in, row, 0, std::min(1, width));
    if (w > 1) TintRow(small + 2, 2, in + 1, row + 1, w - 1, left);
    copy(in, row, w, std::min(w + 1, width));
    if (w > 1) TintRow(small + 2, 2, in + w + 1, row + w + 1, w - 1, right);
    copy(in, row, 2 * w, width);
  };
  ParallelRows(0, h, 2 * static_cast<std::size_t>(width), [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      if (y == 0) {
        copyRow(0);
        copyRow(h);
        continue;
      }
      const Pixel* small = source.ScanLine(2 * y);
      flood(y, small, a, b);
      flood(h + y, small, c, d);
    }
  });
  for (int y = 2 * h; y < height; ++y) copyRow(y);
  return out;
}

constexpr Tint kTiles[3][3] = {
    {{.set = kRed}, {.addR = -120, .addG = 120, .addB = -120}, {.set = kBlue}},
    {{.addR = -80, .addG = 60, .set = kBlue}, {.addR = 120, .addG = 60}, {.set = kRed | kBlue}},
    {{.addR = 80, .addB = 80, .clear = kGreen},
     {.addG = 80, .addB = 80, .clear = kRed},
     {.addR = 80, .addG = 80, .clear = kBlue}},
};

// The third-size copy is not made: each of its rows is picked from the source row it comes
// from, as ResampleNearest would, into a buffer that the nine tiles' rows are tinted from.
Bitmap32 Panel3x3(const Bitmap32& source) {
  const int width = source.Width(), height = source.Height();
  // The size exactly as ResampleNearest computes it.
  const Extended nw = static_cast<Extended>(width) * (1.0L / 3);
  const Extended nh = static_cast<Extended>(height) * (1.0L / 3);
  if (width == 0 || !(nw >= 1.0L) || !(nh >= 1.0L)) return Bitmap32();
  const int w = Trunc(nw), h = Trunc(nh);
  std::vector<int> column(static_cast<std::size_t>(w));
  for (int x = 0; x < w; ++x)
    column[static_cast<std::size_t>(x)] =
        static_cast<int>(static_cast<std::int64_t>(x) * width / w);
  ChannelTint tiles[3][3];
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c) {
      tiles[r][c] = ChannelTintOf(kTiles[r][c]);
      tiles[r][c].clear |= 0xFF000000u;
    }
  Bitmap32 out = ScratchPicture(3 * w, 3 * h);
  // Each row of the small copy makes one row in each row of tiles.
  ParallelRows(0, h, 9 * static_cast<std::size_t>(w), [&](int y0, int y1) {
    std::vector<Pixel> small(static_cast<std::size_t>(w));
    for (int y = y0; y < y1; ++y) {
      const Pixel* in =
          source.ScanLine(static_cast<int>(static_cast<std::int64_t>(y) * height / h));
      for (int x = 0; x < w; ++x)
        small[static_cast<std::size_t>(x)] = in[column[static_cast<std::size_t>(x)]];
      for (int r = 0; r < 3; ++r) {
        Pixel* row = out.ScanLine(r * h + y);
        for (int c = 0; c < 3; ++c) TintRow(small.data(), 1, nullptr, row + c * w, w, tiles[r][c]);
      }
    }
  });
  return out;
}

constexpr Tint kPane2x2[4] = {kFloodA, kFloodC, kFloodB, kFloodD};

// The zone of row y of the 2 x 2 panes; it changes where 2x reaches w.
auto Pane2x2Zones(int w, int h) {
  return [w, h](int y, Cuts* cuts) {
    const int row = 2 * y < h ? 0 : 2;
    if (cuts != nullptr) cuts->Add((w + 1) / 2);
    return [w, row](int x) { return row + (2 * x < w ? 0 : 1); };
  };
}

// By zone row, then zone column.
constexpr Tint kPane3x3[9] = {
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

// The zones of the 3 x 3 panes; a row's zone changes past x = w div 3 and x = 2w div 3.
auto Pane3x3Zones(int w, int h) {
  const auto third = [](int v, int size) {
    return 3 * v <= size ? 0 : (3 * v <= 2 * size ? 1 : 2);
  };
  return [w, h, third](int y, Cuts* cuts) {
    const int row = 3 * third(y, h);
    if (cuts != nullptr) {
      cuts->Add(w / 3 + 1);
      cuts->Add(2 * static_cast<std::int64_t>(w) / 3 + 1);
    }
    return [w, row, third](int x) { return row + third(x, w); };
  };
}

// Zone numbers of the catercorner triangles: bit 1 lower-left of the main diagonal, bit 0
// right of the anti-diagonal. Panel2x2's quadrants take the same floods in the same order.
constexpr Tint kTriangles[4] = {kFloodA, kFloodB, kFloodC, kFloodD};

auto Catercorner4Zones(int w, int h) {
  return [w, h](int y, Cuts* cuts) {
    const Extended diagonal = (static_cast<Extended>(w) / h) * y;
    const std::int64_t lastLower = Floor(diagonal);
    const Extended anti = static_cast<Extended>(std::int64_t{w} * (h - y)) / h;
    const std::int64_t firstRight =
        FirstTrue(Floor(anti), [&](std::int64_t x) { return x >= anti; });
    if (cuts != nullptr) {
      cuts->Add(lastLower + 1);
      cuts->Add(firstRight);
    }
    return [lastLower, firstRight](int x) {
      return (x <= lastLower ? 2 : 0) + (x >= firstRight ? 1 : 0);
    };
  };
}

auto Catercorner16Zones(int w, int h) {
  const Extended halfW = static_cast<Extended>(w) / 2, halfH = static_cast<Extended>(h) / 2;
  const Extended slope = static_cast<Extended>(w) / h;
  return [=](int y, Cuts* cuts) {
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
    if (cuts != nullptr) {
      cuts->Add(Floor(halfW) + 1);
      cuts->Add(leftLastLower + 1);
      cuts->Add(leftFirstRight);
      cuts->Add(rightLastLower + 1);
      cuts->Add(rightFirstRight);
    }
    return [=](int x) {
      const bool left = x <= halfW;
      const std::int64_t lastLower = left ? leftLastLower : rightLastLower;
      const std::int64_t firstRight = left ? leftFirstRight : rightFirstRight;
      return (x <= lastLower ? 2 : 0) + (x >= firstRight ? 1 : 0);
    };
  };
}

}  // namespace

Pixel ColorPanelTinted(Pixel p, PanelLayout layout, int tile) {
  const bool nine = layout == PanelLayout::Panel3x3 || layout == PanelLayout::Pane3x3;
  if (tile < 0 || tile >= (nine ? 9 : 4)) return p;
  const auto at = static_cast<std::size_t>(tile);
  switch (layout) {
    case PanelLayout::Panel2x2:
    case PanelLayout::Catercorner4:
    case PanelLayout::Catercorner16:
      return Tinted(p, kTriangles[at]);
    case PanelLayout::Panel3x3:
      return Tinted(p, kTiles[at / 3][at % 3]);
    case PanelLayout::Pane2x2:
      return Tinted(p, kPane2x2[at]);
    case PanelLayout::Pane3x3:
      return Tinted(p, kPane3x3[at]);
  }
  return p;
}

int ColorPanelZone(PanelLayout layout, int w, int h, int x, int y) {
  switch (layout) {
    case PanelLayout::Pane2x2:
      return Pane2x2Zones(w, h)(y, nullptr)(x);
    case PanelLayout::Pane3x3:
      return Pane3x3Zones(w, h)(y, nullptr)(x);
    case PanelLayout::Catercorner4:
      return Catercorner4Zones(w, h)(y, nullptr)(x);
    case PanelLayout::Catercorner16:
      return Catercorner16Zones(w, h)(y, nullptr)(x);
    default:
      return 0;
  }
}

Bitmap32 ColorPanel(const Bitmap32& source, PanelLayout layout) {
  const int w = source.Width(), h = source.Height();
  switch (layout) {
    case PanelLayout::Panel2x2:
      return Panel2x2(source);
    case PanelLayout::Panel3x3:
      return Panel3x3(source);
    case PanelLayout::Pane2x2:
      return Zoned(source, kPane2x2, Pane2x2Zones(w, h));
    case PanelLayout::Pane3x3:
      return Zoned(source, kPane3x3, Pane3x3Zones(w, h));
    case PanelLayout::Catercorner4:
      return Zoned(source, kTriangles, Catercorner4Zones(w, h));
    case PanelLayout::Catercorner16:
      return Zoned(source, kTriangles, Catercorner16Zones(w, h));
  }
  return source;
}

const EffectSpec& ColorPanelEffect() {
  static const EffectSpec entry{
      .menu = EffectMenu::Adjust,
      .menuPosition = 1,
      .menuEntry = "Color panel",
      .menuObjectName = "Colorpanel1",
      .windowObjectName = "TColor_Panel",
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
      .reference = {.hash = 0x0bcdb3260dab7c46,
                    .topLeft = 0x88522e,
                    .centre = 0x97968c,
                    .bottomRight = 0x1c4930},
      .routine =
          [](const EffectInput& in) {
            return ColorPanel(in.source, static_cast<PanelLayout>(in.params.GetInt("layout")));
          },
  };
  return entry;
}

}  // namespace quillane
