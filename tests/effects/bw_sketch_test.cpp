#include "effects/mono/bw_sketch.h"

#include <gtest/gtest.h>

#include "imaging/edge_map.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

Bitmap32 Scene() {
  Bitmap32 b(9, 7);
  for (int y = 0; y < 7; ++y)
    for (int x = 0; x < 9; ++x)
      b.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 30), static_cast<std::uint8_t>(y * 40),
                         static_cast<std::uint8_t>((x * y * 17) % 256), 255};
  return b;
}

TEST(PencilSketch, LightingAtNeutralIsTheGrayEdgeMap) {
  Bitmap32 edges = Scene();
  InvertedSobelEdges(edges);
  ConvertToGray(edges);
  EXPECT_EQ(PencilSketch(Scene(), PencilToneMode::Lighting, 3, 128), edges);
  EXPECT_TRUE(PencilSketch(Bitmap32(), PencilToneMode::Contrast, 45, 128).Empty());
}

}  // namespace
}  // namespace quillane
