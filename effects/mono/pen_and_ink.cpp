// Pen and ink: the outlines of the dark areas of the photograph.
#include "effects/mono/pen_and_ink.h"

#include <algorithm>
#include <vector>

#include "effects/mono/pen_sketch.h"
#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

// InkGrayValue in integers: 1000 times the weighted sum is 299 R + 587 G + 110 B exactly, and
// away from an exact half the extended-precision sum (within 1e-15 of it) rounds the same way.
// At an exact half its rounding errors decide, so it is formed as InkGrayValue forms it.
inline int FastInkGray(int r, int g, int b) {
  const int n = 299 * r + 587 * g + 110 * b;
  const int k = n / 1000;
  const int rest = n - 1000 * k;
  if (rest != 500) return rest < 500 ? k : k + 1;
  return InkGrayValue(r, g, b);
}

}  // namespace

std::uint8_t InkGrayValue(int r, int g, int b) {
  return static_cast<std::uint8_t>(ClampByte(Round(0.299L * r + 0.587L * g + 0.11L * b)));
}

void InkGrayLevels(const Pixel* in, std::uint8_t* out, int count) {
  for (int x = 0; x < count; ++x)
    out[x] = static_cast<std::uint8_t>(FastInkGray(in[x].r, in[x].g, in[x].b));
}

void PictureTwoValue(TBitmap32& bitmap, int threshold) {
  Pixel* p = bitmap.Data();
  const std::size_t n = bitmap.PixelCount();
  for (std::size_t i = 0; i < n; ++i)
    p[i] = InkGrayValue(p[i].r, p[i].g, p[i].b) > threshold ? kPaper : kInk;
}

TBitmap32 penandink(const TBitmap32& thresholded) {
  const TBitmap32 snapshot = thresholded;
  TBitmap32 outline = thresholded;
  const auto ink = [&](int x, int y) {
    const Pixel& p = snapshot.At(x, y);
    return p.b == 0 && p.g == 0 && p.r == 0;
  };
  for (int y = 1; y <= thresholded.Height() - 2; ++y)
    for (int x = 1; x <= thresholded.Width() - 2; ++x) {
      bool inside = true;
      for (int j = -1; j <= 1; ++j)
        for (int i = -1; i <= 1; ++i) inside = inside && ink(x + i, y + j);
      if (inside) outline.At(x, y) = kPaper;
    }
  return outline;
}

void ColorValue(TBitmap32& outline, const TBitmap32& source) {
  for (int y = 0; y < outline.Height(); ++y)
    for (int x = 0; x < outline.Width(); ++x) {
      Pixel& p = outline.At(x, y);
      if (p.r != 0) continue;
      const Pixel& s = source.At(x, y);
      p = Pixel{s.b, s.g, s.r, 255};
    }
}

TBitmap32 Pen_and_Ink(const TBitmap32& source, int threshold, bool colorInk) {
  const int w = source.Width(), h = source.Height();
  TBitmap32 result(w, h);
  if (result.Empty()) return result;
  const auto width = static_cast<std::size_t>(w);
  const auto write = [&](Pixel& out, const Pixel& in, bool isPaper) {
    out = isPaper ? kPaper : (colorInk ? Pixel{in.b, in.g, in.r, 255} : kInk);
  };
  ParallelRows(0, h, width * 4, [&](int y0, int y1) {
    // Paper (0xFF) or ink (0) of the rows around the one being written, three at a time, so no
    // row is thresholded more than once within the band.
    std::vector<std::uint8_t> rings(3 * width), column(width);
    const auto paper = [&](int y) {
      return rings.data() + static_cast<std::size_t>(y % 3) * width;
    };
    const auto thresholdRow = [&](int y) {
      std::uint8_t* cells = paper(y);
      InkGrayLevels(source.ScanLine(y), cells, w);
      for (int x = 0; x < w; ++x) cells[x] = cells[x] > threshold ? 0xFF : 0;
    };
    if (y0 > 0) thresholdRow(y0 - 1);
    thresholdRow(y0);
    for (int y = y0; y < y1; ++y) {
      if (y + 1 < h) thresholdRow(y + 1);
      const Pixel* in = source.ScanLine(y);
      Pixel* out = result.ScanLine(y);
      const std::uint8_t* self = paper(y);
      if (y == 0 || y == h - 1 || w < 3) {
        for (int x = 0; x < w; ++x) write(out[x], in[x], self[x] != 0);
        continue;
      }
      // A pixel is cleared when no paper lies in its three columns of three rows.
      const std::uint8_t* above = paper(y - 1);
      const std::uint8_t* below = paper(y + 1);
      for (int x = 0; x < w; ++x)
        column[static_cast<std::size_t>(x)] = above[x] | self[x] | below[x];
      write(out[0], in[0], self[0] != 0);
      for (int x = 1; x < w - 1; ++x) {
        const auto i = static_cast<std::size_t>(x);
        const bool inside = (column[i - 1] | column[i] | column[i + 1]) == 0;
        write(out[x], in[x], inside || self[x] != 0);
      }
      write(out[w - 1], in[w - 1], self[w - 1] != 0);
    }
  });
  return result;
}

const EffectSpec& PenAndInkEffect() {
  static const EffectSpec entry{
      .toolNumber = 4,
      .menu = EffectMenu::Mono,
      .menuPosition = 4,
      .menuEntry = "Pen && Ink",
      .menuHandler = "PenInk1Click",
      .windowClass = "TPen_and_Ink",
      .caption = "Pen_and_Ink",
      .statusText = "Pen and Ink",
      .cliName = "pen-and-ink",
      .batchTag = "Pen_and_Ink",
      .collapsedHeight = 109,
      .expandedHeight = 186,
      .colorUp = true,
      .batchPushesHistory = true,
      .lineArtAfterApply = true,
      .params =
          {
              {.name = "adjust-thread",
               .objectName = "TrackBar1",
               .captionLabel = "Label8",
               .caption = "Adjust thread:",
               .maximum = 255,
               .defaultValue = 128,
               .numberLabel = "Label9",
               .initialNumber = "128",
               .help = "gray level at or below which the photograph is inked"},
              {.kind = ParamKind::Switch,
               .name = "color-ink",
               .objectName = "CheckBox1",
               .caption = "Color Ink",
               .maximum = 1,
               .help = "the outlines take the photograph's colours"},
          },
      .routine =
          [](const EffectInput& in) {
            return Pen_and_Ink(in.source, in.params.GetInt("adjust-thread"),
                               in.params.Get("color-ink") != 0);
          },
  };
  return entry;
}

TBitmap32 PenAndInkReference(const TBitmap32& source, int threshold, bool colorInk) {
  TBitmap32 thresholded = source;
  PictureTwoValue(thresholded, threshold);
  TBitmap32 outline = penandink(thresholded);
  if (colorInk) ColorValue(outline, source);
  return outline;
}

}  // namespace quillane
