// Colour filter, colour variety and colour panel on small crafted pictures, and against their
// plain formulas.
#include <gtest/gtest.h>

#include <algorithm>
#include <map>

#include "effects/adjust/color_filter.h"
#include "effects/adjust/color_panel.h"
#include "effects/adjust/color_variety.h"
#include "imaging/numeric.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

Pixel Rgb3(int r, int g, int b) {
  return Pixel{static_cast<std::uint8_t>(b), static_cast<std::uint8_t>(g),
               static_cast<std::uint8_t>(r), 255};
}

// A zone's change: channels set (-1 keeps) and then raised (limited to 255), red, green, blue.
// Floods A to D, then the nine zones of Pane 3 x 3 by row and column.
struct Change {
  int set[3], add[3];
};
const std::map<char, Change> kChanges = {
    {'A', {{255, -1, -1}, {}}},         {'B', {{-1, 255, 0}, {}}},
    {'C', {{0, -1, 255}, {}}},          {'D', {{255, -1, 255}, {}}},
    {'0', {{255, -1, -1}, {}}},         {'1', {{-1, 255, -1}, {0, 0, 50}}},
    {'2', {{-1, -1, 255}, {}}},         {'3', {{-1, 255, -1}, {100, 0, 0}}},
    {'4', {{-1, -1, 255}, {0, 50, 0}}}, {'5', {{-1, 255, -1}, {}}},
    {'6', {{255, -1, 255}, {}}},        {'7', {{-1, 255, 255}, {}}},
    {'8', {{255, -1, -1}, {}}}};

Pixel Changed(Pixel p, char zone) {
  const Change& c = kChanges.at(zone);
  std::uint8_t* channel[3] = {&p.r, &p.g, &p.b};
  for (int i = 0; i < 3; ++i) {
    if (c.set[i] >= 0) *channel[i] = static_cast<std::uint8_t>(c.set[i]);
    *channel[i] = static_cast<std::uint8_t>(std::min(255, *channel[i] + c.add[i]));
  }
  return p;
}

TEST(ColorPanel, Panel2x2WritesQuartersFromTheHalfSizeCopy) {
  const Bitmap32 in = RandomPicture(4, 4, 5);
  const Bitmap32 out = ColorPanel(in, PanelLayout::Panel2x2);
  for (int y = 0; y < 4; ++y)
    for (int x = 0; x < 4; ++x) {
      if (x % 2 == 1 && y % 2 == 1) continue;
      EXPECT_EQ(out.At(x, y), in.At(x, y)) << x << "," << y;
    }
  // The half-size copy's pixel (1, 1) is the source's (2, 2); alpha stays the base's.
  const auto expect = [&](int x, int y, char flood) {
    Pixel p = Changed(in.At(2, 2), flood);
    p.a = in.At(x, y).a;
    EXPECT_EQ(out.At(x, y), p) << flood;
  };
  expect(1, 1, 'A'), expect(3, 1, 'B'), expect(1, 3, 'C'), expect(3, 3, 'D');
}

TEST(ColorPanel, Panel3x3TilesAThirdSizeCopyWithAlphaZero) {
  const Bitmap32 out = ColorPanel(RandomPicture(301, 200, 2), PanelLayout::Panel3x3);
  ASSERT_EQ(out.Width(), 300);
  ASSERT_EQ(out.Height(), 198);
  for (int y = 0; y < 198; ++y)
    for (int x = 0; x < 300; ++x) ASSERT_EQ(out.At(x, y).a, 0);
  for (auto [w, h] : {std::pair{2, 9}, {9, 2}, {0, 0}})
    EXPECT_TRUE(ColorPanel(RandomPicture(w, h, 1), PanelLayout::Panel3x3).Empty());
  // One source pixel per tile: every tile's own tint.
  const Bitmap32 tiles = ColorPanel(Bitmap32(3, 3, Rgb3(100, 30, 200)), PanelLayout::Panel3x3);
  const Pixel expected[9] = {Rgb3(255, 30, 200), Rgb3(0, 150, 80),   Rgb3(100, 30, 255),
                             Rgb3(20, 90, 255),  Rgb3(220, 90, 200), Rgb3(255, 30, 255),
                             Rgb3(180, 0, 255),  Rgb3(0, 110, 255),  Rgb3(180, 110, 0)};
  for (int i = 0; i < 9; ++i) {
    Pixel p = expected[i];
    p.a = 0;
    EXPECT_EQ(tiles.At(i % 3, i / 3), p) << i;
  }
}

// The zone layouts as stated, pixel by pixel in extended precision.
char PlainZone(PanelLayout layout, int x, int y, int w, int h) {
  const Extended W = w, H = h;
  const auto triangle = [](bool lower, bool right) {
    return lower ? (right ? 'D' : 'C') : (right ? 'B' : 'A');
  };
  switch (layout) {
    case PanelLayout::Pane2x2:
      return y < H / 2 ? (x < W / 2 ? 'A' : 'C') : (x < W / 2 ? 'B' : 'D');
    case PanelLayout::Pane3x3: {
      const auto zone = [](int v, Extended size) {
        return v <= size / 3 ? 0
                             : (v <= static_cast<Extended>(2 * static_cast<int>(size)) / 3 ? 1 : 2);
      };
      return static_cast<char>('0' + 3 * zone(y, H) + zone(x, W));
    }
    case PanelLayout::Catercorner4:
      return triangle(x <= (W / H) * y, x >= static_cast<Extended>(w * (h - y)) / H);
    default: {
      const bool top = y <= H / 2, left = x <= W / 2;
      const Extended u = left ? x : x - W / 2, v = top ? y : y - H / 2;
      const Extended far = static_cast<Extended>(w * (h - y)) / H;
      const bool right =
          top && left ? x >= (H / 2 - y) * W / H : (left || top ? x >= far : u >= far);
      return triangle(u <= (W / H) * v, right);
    }
  }
}

TEST(ColorPanel, ZoneLayoutsMatchTheirBordersOnOddAndEvenSizes) {
  const std::pair<int, int> kSizes[] = {{7, 5},   {10, 3}, {9, 9}, {6, 4}, {5, 8}, {300, 7},
                                        {31, 17}, {1, 6},  {6, 1}, {2, 2}, {0, 0}};
  for (PanelLayout layout : {PanelLayout::Pane2x2, PanelLayout::Pane3x3, PanelLayout::Catercorner4,
                             PanelLayout::Catercorner16})
    for (auto [w, h] : kSizes) {
      const Bitmap32 in = RandomPicture(w, h, static_cast<unsigned>(w * h));
      Bitmap32 expected = in;
      for (int y = 1; y < h; ++y)
        for (int x = 1; x < w; ++x)
          expected.At(x, y) = Changed(in.At(x, y), PlainZone(layout, x, y, w, h));
      ASSERT_EQ(ColorPanel(in, layout), expected)
          << static_cast<int>(layout) << " " << w << "x" << h;
    }
  // Pane 3 x 3 at width 300: column 100 is in the left zone, column 200 in the middle one.
  const Bitmap32 pane = ColorPanel(Bitmap32(300, 2, Rgb3(10, 10, 10)), PanelLayout::Pane3x3);
  EXPECT_EQ(pane.At(100, 1), Rgb3(110, 255, 10));
  EXPECT_EQ(pane.At(200, 1), Rgb3(10, 60, 255));
  EXPECT_EQ(pane.At(201, 1), Rgb3(10, 255, 10));
}

TEST(ColorFilter, GrayThenTheFilterChannelsAtFull) {
  struct Case {
    ColorFilterKind kind;
    Pixel in, out;
  } const cases[] = {
      {ColorFilterKind::Red, Rgb3(0, 0, 0), Rgb3(255, 0, 0)},
      {ColorFilterKind::Red, Rgb3(10, 20, 30), Rgb3(255, 18, 18)},
      {ColorFilterKind::Yellow, Rgb3(128, 128, 128), Rgb3(255, 255, 128)},
      {ColorFilterKind::Cyan, Rgb3(5, 0, 0), Rgb3(2, 255, 255)},  // Round(1.5) = 2
      {ColorFilterKind::Purple, Rgb3(0, 100, 0), Rgb3(255, 59, 255)},
      {ColorFilterKind::Blue, Rgb3(0, 0, 100), Rgb3(11, 11, 255)},
  };
  for (const Case& c : cases) {
    Pixel in = c.in;
    in.a = 0;
    EXPECT_EQ(ColorFilter(Bitmap32(1, 1, in), c.kind).At(0, 0), c.out) << static_cast<int>(c.kind);
  }
  EXPECT_TRUE(ColorFilter(Bitmap32(), ColorFilterKind::Red).Empty());
}

TEST(ColorVariety, ClicksAccumulateUpToFull) {
  const Bitmap32 one(1, 1, Rgb3(100, 150, 250));
  EXPECT_EQ(variety(one, 4).At(0, 0), Rgb3(110, 160, 250));
  EXPECT_EQ(variety(variety(one, 4), 4).At(0, 0), Rgb3(120, 170, 250));
  EXPECT_EQ(VarietyClicks(one, {1, 5}).At(0, 0), Rgb3(110, 160, 255));
  EXPECT_EQ(VarietyClicks(Bitmap32(1, 1, Rgb3(5, 0, 0)), std::vector<std::int64_t>(25, 1)).At(0, 0),
            Rgb3(255, 0, 0));
  EXPECT_EQ(VarietyClicks(Bitmap32(1, 1, Rgb3(4, 0, 0)), std::vector<std::int64_t>(25, 1)).At(0, 0),
            Rgb3(254, 0, 0));
  // All at once is click after click, on every size.
  for (auto [w, h] : {std::pair{13, 7}, {1, 1}, {0, 0}}) {
    const Bitmap32 in = RandomPicture(w, h, 4);
    const std::vector<std::int64_t> clicks = {3, 6, 6, 2, 4, 5, 1, 6};
    Bitmap32 stepwise = in;
    for (std::int64_t c : clicks) stepwise = variety(stepwise, static_cast<int>(c));
    EXPECT_EQ(VarietyClicks(in, clicks), stepwise) << w << "x" << h;
  }
}

}  // namespace
}  // namespace quillane
