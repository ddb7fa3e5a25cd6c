#include "tests/reference/mono_reference.h"

#include "imaging/numeric.h"
#include "tests/reference/imaging_reference.h"

namespace quillane {

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

}  // namespace quillane
