#include "effects/paint/brume.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <vector>

#include "effects/registry.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

constexpr std::uint32_t kMultiplier = 134775813u;

// seed -> mul * seed + add, the effect of some number of steps.
struct Affine {
  std::uint32_t mul = 1;
  std::uint32_t add = 0;
  // This map after first.
  Affine After(const Affine& first) const { return {mul * first.mul, mul * first.add + add}; }
  std::uint32_t operator()(std::uint32_t seed) const { return mul * seed + add; }
};

Affine Steps(std::uint64_t steps) {
  Affine result;
  Affine power{kMultiplier, 1};
  for (; steps != 0; steps >>= 1) {
    if (steps & 1) result = power.After(result);
    power = power.After(power);
  }
  return result;
}

inline std::uint32_t Scaled(std::uint32_t seed, std::uint32_t range) {
  return static_cast<std::uint32_t>((static_cast<std::uint64_t>(range) * seed) >> 32);
}

// Lanes of the generator run side by side, each kLanes steps ahead of the last, so that the
// next value never waits on the one before.
constexpr int kLanes = 8;

void BrumeRows(const TBitmap32& source, TBitmap32& out, int scope, std::uint32_t seed, int y0,
               int y1) {
  const int w = source.Width();
  const int h = source.Height();
  const auto range = static_cast<std::uint32_t>(scope + 3);
  const Affine lanesAhead = Steps(kLanes);
  // A row draw d picks source row y + d - scope, limited to the picture: one pointer per d.
  std::vector<const Pixel*> pickRows(range);
  for (int y = y0; y < y1; ++y) {
    for (std::uint32_t d = 0; d < range; ++d)
      pickRows[d] = source.ScanLine(std::clamp(static_cast<int>(d) + y - scope, 0, h - 1));
    std::array<std::uint32_t, kLanes> lane;
    std::uint32_t s = seed;
    for (std::uint32_t& l : lane) l = s = kMultiplier * s + 1;
    Pixel* row = out.ScanLine(y);
    const auto pick = [&](std::uint32_t rowSeed, std::uint32_t columnSeed, int x) {
      const int rx = std::clamp(static_cast<int>(Scaled(columnSeed, range)) + x - scope, 0, w - 1);
      const Pixel p = pickRows[Scaled(rowSeed, range)][rx];
      row[x] = Pixel{p.b, p.g, p.r, 255};
    };
    int x = 1;
    // kLanes / 2 pixels per round, each taking a row draw and then a column draw.
    for (; x + kLanes / 2 <= w; x += kLanes / 2) {
      for (int i = 0; i < kLanes / 2; ++i) pick(lane[2 * i], lane[2 * i + 1], x + i);
      for (std::uint32_t& l : lane) l = lanesAhead(l);
    }
    // The last few pixels of the row take the lanes in order.
    for (int i = 0; x < w; ++x, i += 2) pick(lane[i], lane[i + 1], x);
    seed = RandomJump(seed, 2 * static_cast<std::uint64_t>(w - 1));
  }
}

}  // namespace

std::uint32_t RandomDraw(std::uint32_t& seed, std::uint32_t range) {
  seed = kMultiplier * seed + 1;
  return Scaled(seed, range);
}

std::uint32_t RandomJump(std::uint32_t seed, std::uint64_t steps) {
  return Steps(steps)(seed);
}

TBitmap32 Brume(const TBitmap32& source, int scope, std::uint32_t& seed) {
  TBitmap32 out(source.Width(), source.Height());
  BrumeInto(source, scope, seed, out);
  return out;
}

void BrumeInto(const TBitmap32& source, int scope, std::uint32_t& seed, TBitmap32& out) {
  const int w = source.Width();
  const int h = source.Height();
  if (w == 0) return;
  // Row 0 and column 0 keep the source; every other pixel is written below.
  std::memcpy(out.ScanLine(0), source.ScanLine(0), static_cast<std::size_t>(w) * sizeof(Pixel));
  for (int y = 1; y < h; ++y) out.ScanLine(y)[0] = source.ScanLine(y)[0];
  if (w < 2 || h < 2) {
    std::memcpy(out.Data(), source.Data(), source.PixelCount() * sizeof(Pixel));
    return;
  }
  // Each band of rows starts from the seed as it stands after the rows above it, so any split
  // draws exactly what one thread would.
  const std::uint64_t perRow = 2 * static_cast<std::uint64_t>(w - 1);
  const std::uint32_t start = seed;
  ParallelRows(1, h, static_cast<std::size_t>(w) * 3, [&](int y0, int y1) {
    BrumeRows(source, out, scope, RandomJump(start, perRow * static_cast<std::uint64_t>(y0 - 1)),
              y0, y1);
  });
  seed = RandomJump(start, perRow * static_cast<std::uint64_t>(h - 1));
}

TBitmap32 BrumeReference(const TBitmap32& source, int scope, std::uint32_t& seed) {
  TBitmap32 a = source;
  const TBitmap32 s = source;
  const int w = source.Width();
  const int h = source.Height();
  const auto range = static_cast<std::uint32_t>(scope + 3);
  for (int y = 1; y <= h - 1; ++y)
    for (int x = 1; x <= w - 1; ++x) {
      int ry = static_cast<int>(RandomDraw(seed, range)) + y - scope;
      int rx = static_cast<int>(RandomDraw(seed, range)) + x - scope;
      if (ry >= h)
        ry = h - 1;
      else if (ry < 0)
        ry = 0;
      if (rx >= w)
        rx = w - 1;
      else if (rx < 0)
        rx = 0;
      const Pixel p = s.At(rx, ry);
      a.At(x, y) = Pixel{p.b, p.g, p.r, 255};
    }
  return a;
}

const EffectSpec& BrumeEffect() {
  static const EffectSpec entry{
      .toolNumber = 10,
      .menu = EffectMenu::Color,
      .menuPosition = 6,
      .menuEntry = "Brume",
      .menuHandler = "Brume1Click",
      .windowClass = "TBrume",
      .caption = "Brume",
      .statusText = "Brume",
      .cliName = "brume",
      .batchTag = "Brume",
      .collapsedHeight = 103,
      .expandedHeight = 184,
      .batchPushesHistory = true,
      .inputField = "Edit10",
      .outputField = "Edit11",
      .params =
          {
              {.name = "scope",
               .objectName = "TrackBar2",
               .captionLabel = "Label2",
               .caption = "Scope:",
               .minimum = 1,
               .maximum = 10,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "how far colours travel: up to N pixels down and right, 2 up and left"},
          },
      .routine =
          [](const EffectInput& in) {
            // Without the document's generator (a caller that keeps none) a run starts afresh.
            std::uint32_t fresh = 0;
            return Brume(in.source, in.params.GetInt("scope"), in.random ? *in.random : fresh);
          },
  };
  return entry;
}

}  // namespace quillane
