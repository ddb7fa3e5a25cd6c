#include "effects/mono/bw_sketch.h"

#include <gtest/gtest.h>

#include "imaging/edge_map.h"
#include "imaging/tone.h"

namespace quillane {
namespace {

Pixel Gray(std::uint8_t v) {
  return Pixel{v, v, v, 255};
}

TEST(PencilSketch, FlatPictureGivesUniformTones) {
  const TBitmap32 flat(6, 5, Pixel{40, 90, 200, 255});
  for (int v : {128, 200, 255})
    EXPECT_EQ(peccilsketch(flat, PencilToneMode::Lighting, 0, v), TBitmap32(6, 5, Gray(255)));
  for (int c : {45, 60, 89})
    EXPECT_EQ(peccilsketch(flat, PencilToneMode::Contrast, c, 0), TBitmap32(6, 5, Gray(255)));
  EXPECT_EQ(peccilsketch(flat, PencilToneMode::Contrast, 10, 0), TBitmap32(6, 5, Gray(250)));
  EXPECT_EQ(peccilsketch(flat, PencilToneMode::Contrast, 0, 0), TBitmap32(6, 5, Gray(255)));
  EXPECT_EQ(peccilsketch(flat, PencilToneMode::Lighting, 45, 0), TBitmap32(6, 5, Gray(0)));
  EXPECT_EQ(peccilsketch(flat, PencilToneMode::Lighting, 45, 100), TBitmap32(6, 5, Gray(199)));
}

TBitmap32 Scene() {
  TBitmap32 b(9, 7);
  for (int y = 0; y < 7; ++y)
    for (int x = 0; x < 9; ++x)
      b.At(x, y) = Pixel{static_cast<std::uint8_t>(x * 30), static_cast<std::uint8_t>(y * 40),
                         static_cast<std::uint8_t>((x * y * 17) % 256), 255};
  return b;
}

TEST(PencilSketch, LightingAtNeutralIsTheGrayEdgeMap) {
  TBitmap32 edges = Scene();
  picsobel(edges);
  ConvertToGray(edges);
  EXPECT_EQ(peccilsketch(Scene(), PencilToneMode::Lighting, 3, 128), edges);
}

TEST(PencilSketch, TinyPicturesNeverFail) {
  for (auto [w, h] : {std::pair{0, 0}, {1, 1}, {1, 5}, {5, 1}, {2, 3}, {3, 2}, {3, 3}}) {
    const TBitmap32 src = TBitmap32(w, h, Pixel{1, 2, 3, 255});
    const TBitmap32 out = peccilsketch(src, PencilToneMode::Contrast, 45, 128);
    EXPECT_EQ(out.Width(), src.Width());
    EXPECT_EQ(out.Height(), src.Height());
  }
}

}  // namespace
}  // namespace quillane
