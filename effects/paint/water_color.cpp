#include "effects/paint/water_color.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <utility>

#include "effects/registry.h"
#include "imaging/numeric.h"
#include "imaging/parallel.h"

namespace quillane {
namespace {

using Byte = std::uint8_t;

// Bytes of a row handled per round, so the column sorts stay in the first-level cache.
constexpr int kChunk = 1024;

// By value, so that the compiler turns them into byte-wide min and max instructions.
inline Byte Min(Byte a, Byte b) {
  return a < b ? a : b;
}
inline Byte Max(Byte a, Byte b) {
  return a < b ? b : a;
}
inline Byte Median3(Byte a, Byte b, Byte c) {
  return Max(Min(a, b), Min(Max(a, b), c));
}

void SharpenRow(const Byte* __restrict above, const Byte* __restrict row,
                const Byte* __restrict below, Byte* __restrict dst, int bytes) {
  // Every sum lies in -1020..1275, so 16 bits hold it.
  for (int i = 4; i < bytes - 4; ++i) {
    const auto v =
        static_cast<std::int16_t>(5 * row[i] - above[i] - below[i] - row[i - 4] - row[i + 4]);
    const std::int16_t low = v < 0 ? 0 : v;
    dst[i] = static_cast<Byte>(low > 255 ? 255 : low);
  }
}

// The median of a 3 x 3 block is the median of three values: the largest of the three column
// minima, the median of the three column medians and the smallest of the three column maxima.
// Each column is sorted once and serves three neighbouring pixels; only min and max are used,
// so many bytes go at once. Any way of finding the median gives the same value.
void MedianRow(const Byte* __restrict above, const Byte* __restrict row,
               const Byte* __restrict below, Byte* __restrict dst, int bytes) {
  Byte lo[kChunk + 8], mid[kChunk + 8], hi[kChunk + 8];
  for (int first = 4; first < bytes - 4; first += kChunk) {
    const int count = std::min(kChunk, bytes - 4 - first);
    const int from = first - 4;
    for (int i = 0; i < count + 8; ++i) {
      const Byte a = above[from + i], b = row[from + i], c = below[from + i];
      const Byte small = Min(a, b), large = Max(a, b);
      lo[i] = Min(small, c);
      hi[i] = Max(large, c);
      mid[i] = Max(small, Min(large, c));
    }
    for (int i = 0; i < count; ++i) {
      const Byte maxLo = Max(Max(lo[i], lo[i + 4]), lo[i + 8]);
      const Byte minHi = Min(Min(hi[i], hi[i + 4]), hi[i + 8]);
      dst[first + i] = Median3(maxLo, Median3(mid[i], mid[i + 4], mid[i + 8]), minHi);
    }
  }
}

// Runs rowPass(above, row, below, out, bytes) on every interior row of in into out, then puts
// the input's alpha back on the pixels the byte-wise pass wrote.
using RowPass = void (*)(const Byte*, const Byte*, const Byte*, Byte*, int);
void InteriorPass(const TBitmap32& in, TBitmap32& out, std::size_t workPerPixel, RowPass rowPass) {
  const int w = in.Width();
  const int h = in.Height();
  if (w < 3 || h < 3) return;
  ParallelRows(1, h - 1, static_cast<std::size_t>(w) * workPerPixel, [&](int y0, int y1) {
    for (int y = y0; y < y1; ++y) {
      const Pixel* row = in.ScanLine(y);
      Pixel* dst = out.ScanLine(y);
      rowPass(reinterpret_cast<const Byte*>(in.ScanLine(y - 1)), reinterpret_cast<const Byte*>(row),
              reinterpret_cast<const Byte*>(in.ScanLine(y + 1)), reinterpret_cast<Byte*>(dst),
              w * 4);
      for (int x = 1; x < w - 1; ++x) dst[x].a = row[x].a;
    }
  });
}

TBitmap32 CopyOf(const TBitmap32& b) {
  return b;
}

// The passes as first written: whole copies, the channels of every pixel one by one.
void sharpen(TBitmap32& p) {
  TBitmap32 a = CopyOf(p);
  const TBitmap32 b = CopyOf(a);
  for (int y = 1; y < p.Height() - 1; ++y)
    for (int x = 1; x < p.Width() - 1; ++x)
      for (Byte Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
        const int v = 5 * b.At(x, y).*c - b.At(x, y - 1).*c - b.At(x - 1, y).*c -
                      b.At(x + 1, y).*c - b.At(x, y + 1).*c;
        a.At(x, y).*c = static_cast<Byte>(ClampByte(v / 1));
      }
  p = a;
}

void soften(TBitmap32& p) {
  TBitmap32 a = CopyOf(p);
  const TBitmap32 b = CopyOf(p);
  int work[3][9];
  for (int y = 1; y < p.Height() - 1; ++y)
    for (int x = 1; x < p.Width() - 1; ++x) {
      int channel = 0;
      for (Byte Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
        int* values = work[channel++];
        for (int i = 0; i < 9; ++i) values[i] = b.At(x + i % 3 - 1, y + i / 3 - 1).*c;
        SelectionSort(values, 8);
        a.At(x, y).*c = static_cast<Byte>(values[4]);
      }
    }
  p = a;
}

}  // namespace

void SelectionSort(int* a, int last) {
  for (int i = 0; i < last; ++i)
    for (int j = last; j > i; --j)
      if (a[j] < a[i]) std::swap(a[i], a[j]);
}

void SharpenPass(const TBitmap32& in, TBitmap32& out) {
  InteriorPass(in, out, 6, SharpenRow);
}

void MedianPass(const TBitmap32& in, TBitmap32& out) {
  InteriorPass(in, out, 8, MedianRow);
}

TBitmap32 watercolor(const TBitmap32& source, int cycles) {
  TBitmap32 picture(source.Width(), source.Height());
  TBitmap32 other(source.Width(), source.Height());
  WaterColorInto(source, cycles, picture, other);
  return picture;
}

void WaterColorInto(const TBitmap32& source, int cycles, TBitmap32& out, TBitmap32& scratch) {
  // The two pictures serve every pass in turn, one read and one written. Both start as the
  // source, and no pass writes the frame or alpha, so those stay the source's in both.
  const std::size_t bytes = source.PixelCount() * sizeof(Pixel);
  if (bytes == 0) return;
  std::memcpy(out.Data(), source.Data(), bytes);
  if (source.Width() < 3 || source.Height() < 3) return;
  std::memcpy(scratch.Data(), source.Data(), bytes);
  for (int i = 0; i < cycles; ++i) {
    SharpenPass(out, scratch);
    MedianPass(scratch, out);
    // The second median goes back into scratch; the two swap roles for the next cycle, which
    // only needs the result in out at the very end.
    MedianPass(out, scratch);
    std::swap(out, scratch);
  }
}

TBitmap32 WaterColorReference(const TBitmap32& source, int cycles) {
  TBitmap32 p = source;
  for (int i = 0; i < cycles; ++i) {
    sharpen(p);
    soften(p);
    soften(p);
  }
  return p;
}

const EffectSpec& WaterColorEffect() {
  static const EffectSpec entry{
      .toolNumber = 9,
      .menu = EffectMenu::Color,
      .menuPosition = 5,
      .menuEntry = "Water color",
      .menuHandler = "Watercolor1Click",
      .windowClass = "TWater_Color",
      .caption = "Water_Color",
      .statusText = "Water color",
      .cliName = "water-color",
      .batchTag = "WaterColor",
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
               .maximum = 5,
               .defaultValue = 3,
               .pageStep = 1,
               .numberLabel = "Label3",
               .initialNumber = "3",
               .help = "cycles of sharpening and two median passes"},
          },
      .routine =
          [](const EffectInput& in) { return watercolor(in.source, in.params.GetInt("scope")); },
  };
  return entry;
}

}  // namespace quillane
