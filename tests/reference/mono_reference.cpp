#include "tests/reference/mono_reference.h"

#include "effects/mono/pen_and_ink.h"
#include "imaging/edge_map.h"
#include "imaging/ink_rows.h"
#include "imaging/numeric.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {
namespace {

bool IsInk(const Pixel& p) {
  return p.b == 0 && p.g == 0 && p.r == 0;
}

}  // namespace

Bitmap32 PencilSketchReference(const Bitmap32& source, PencilToneMode mode, int contrast,
                               int lighting) {
  const Bitmap32 edges = InvertedSobelEdgesReference(source);
  Bitmap32 toned = edges;
  for (int y = 0; y < toned.Height(); ++y)
    for (int x = 0; x < toned.Width(); ++x) {
      Pixel& p = toned.At(x, y);
      int v = GrayValue(p.r, p.g, p.b);
      if (mode == PencilToneMode::Lighting) v = ClampByte(v + 2 * (lighting - 128));
      p = Pixel{static_cast<std::uint8_t>(v), static_cast<std::uint8_t>(v),
                static_cast<std::uint8_t>(v), 255};
    }
  return mode == PencilToneMode::Lighting ? toned : PencilContrastPassReference(toned, contrast);
}

Bitmap32 PenSketchReference(const Bitmap32& source, int pressure) {
  Bitmap32 drawing = source;
  InvertedSobelEdges(drawing);
  for (int y = 0; y < drawing.Height(); ++y)
    for (int x = 0; x < drawing.Width(); ++x) {
      Pixel& p = drawing.At(x, y);
      p = GrayValue(p.r, p.g, p.b) > pressure ? kPaper : kInk;
    }
  return drawing;
}

void BitmapDilate(Bitmap32& bitmap, HatchDirection direction) {
  const HatchNeighbours n = HatchNeighboursOf(direction);
  const int w = bitmap.Width(), h = bitmap.Height();
  if (h - 2 < 1) return;
  const Bitmap32 snapshot = bitmap;
  for (int y = 1; y <= h - 2; ++y)
    for (int x = 1; x <= w - 2; ++x) {
      Pixel& p = bitmap.At(x, y);
      if (IsInk(p)) continue;
      if (IsInk(snapshot.At(x + n.dx1, y + n.dy1)) || IsInk(snapshot.At(x + n.dx2, y + n.dy2))) {
        p.b = p.g = p.r = 0;
      }
    }
}

Bitmap32 VuzorarReference(const Bitmap32& source, int pressure, int scope,
                          HatchDirection direction) {
  Bitmap32 drawing = PenSketchReference(source, pressure);
  for (int i = 0; i < scope; ++i) BitmapDilate(drawing, direction);
  return drawing;
}

void PictureTwoValue(Bitmap32& bitmap, int threshold) {
  Pixel* p = bitmap.Data();
  const std::size_t n = bitmap.PixelCount();
  for (std::size_t i = 0; i < n; ++i)
    p[i] = InkGrayValue(p[i].r, p[i].g, p[i].b) > threshold ? kPaper : kInk;
}

Bitmap32 OutlineDarkAreas(const Bitmap32& thresholded) {
  const Bitmap32 snapshot = thresholded;
  Bitmap32 outline = thresholded;
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

void ColorValue(Bitmap32& outline, const Bitmap32& source) {
  for (int y = 0; y < outline.Height(); ++y)
    for (int x = 0; x < outline.Width(); ++x) {
      Pixel& p = outline.At(x, y);
      if (p.r != 0) continue;
      const Pixel& s = source.At(x, y);
      p = Pixel{s.b, s.g, s.r, 255};
    }
}

Bitmap32 PenAndInkReference(const Bitmap32& source, int threshold, bool colorInk) {
  Bitmap32 thresholded = source;
  PictureTwoValue(thresholded, threshold);
  Bitmap32 outline = OutlineDarkAreas(thresholded);
  if (colorInk) ColorValue(outline, source);
  return outline;
}

}  // namespace quillane
