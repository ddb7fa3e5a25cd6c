#include "tests/reference/paint_reference.h"

#include <cstdint>
#include <utility>

#include "effects/paint/brume.h"
#include "effects/paint/color_pencil.h"
#include "imaging/edge_map.h"
#include "imaging/numeric.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

using Byte = std::uint8_t;

Bitmap32 CopyOf(const Bitmap32& b) {
  return b;
}

// The passes as first written: whole copies, the channels of every pixel one by one.
void SharpenPlain(Bitmap32& p) {
  Bitmap32 a = CopyOf(p);
  const Bitmap32 b = CopyOf(a);
  for (int y = 1; y < p.Height() - 1; ++y)
    for (int x = 1; x < p.Width() - 1; ++x)
      for (Byte Pixel::*c : {&Pixel::r, &Pixel::g, &Pixel::b}) {
        const int v = 5 * b.At(x, y).*c - b.At(x, y - 1).*c - b.At(x - 1, y).*c -
                      b.At(x + 1, y).*c - b.At(x, y + 1).*c;
        a.At(x, y).*c = static_cast<Byte>(ClampByte(v / 1));
      }
  p = a;
}

void MedianPlain(Bitmap32& p) {
  Bitmap32 a = CopyOf(p);
  const Bitmap32 b = CopyOf(p);
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

Bitmap32 BrumeReference(const Bitmap32& source, int scope, std::uint32_t& seed) {
  Bitmap32 a = source;
  const Bitmap32 s = source;
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

Bitmap32 ColorSketchReference(const Bitmap32& source, int pressure) {
  Bitmap32 edges = source;
  InvertedSobelEdges(edges);
  Bitmap32 out = source;
  for (int y = 0; y < out.Height(); ++y) {
    for (int x = 0; x < out.Width(); ++x) {
      const Pixel ep = edges.At(x, y);
      const int e = ColorPencilEdgeTone(GrayValue(ep.r, ep.g, ep.b), pressure);
      Pixel& p = out.At(x, y);
      const Hsl hsl = RgbToHsl(p.r, p.g, p.b);
      const Rgb rgb = HslToRgb(hsl.h, hsl.s, ColorPencilLightness(e, hsl.l));
      p = Pixel{static_cast<std::uint8_t>(rgb.b), static_cast<std::uint8_t>(rgb.g),
                static_cast<std::uint8_t>(rgb.r), 255};
    }
  }
  return out;
}

void SelectionSort(int* a, int last) {
  for (int i = 0; i < last; ++i)
    for (int j = last; j > i; --j)
      if (a[j] < a[i]) std::swap(a[i], a[j]);
}

Bitmap32 WaterColorReference(const Bitmap32& source, int cycles) {
  Bitmap32 p = source;
  for (int i = 0; i < cycles; ++i) {
    SharpenPlain(p);
    MedianPlain(p);
    MedianPlain(p);
  }
  return p;
}

}  // namespace quillane
