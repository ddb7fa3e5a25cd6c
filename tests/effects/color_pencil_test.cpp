#include "effects/paint/color_pencil.h"

#include <gtest/gtest.h>

namespace quillane {
namespace {

const Pixel kWhite{255, 255, 255, 255};

// Colours of every kind: grays, saturated and muddy ones, edges in all directions.
TBitmap32 Varied(int w, int h) {
  TBitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x) {
      const unsigned v =
          (static_cast<unsigned>(x) * 2654435761u) ^ (static_cast<unsigned>(y) * 40503u);
      b.At(x, y) = (x / 3 + y / 2) % 5 == 0
                       ? Pixel{static_cast<std::uint8_t>(x * 7), static_cast<std::uint8_t>(x * 7),
                               static_cast<std::uint8_t>(x * 7), 255}
                       : Pixel{static_cast<std::uint8_t>(v), static_cast<std::uint8_t>(v >> 8),
                               static_cast<std::uint8_t>(v >> 16), 255};
    }
  return b;
}

TEST(ColorPencil, FlatAreasTurnWhiteAndStrongEdgesKeepTheirColour) {
  EXPECT_EQ(colorsketch(TBitmap32(6, 5, Pixel{30, 140, 220, 255}), 45), TBitmap32(6, 5, kWhite));
  // A one-pixel line of (R, G, B) = (200, 100, 100) on black: its edge map is black there, so
  // it keeps its lightness and comes back through the HSL model as (201, 101, 101).
  TBitmap32 line(7, 5, Pixel{0, 0, 0, 255});
  for (int x = 0; x < 7; ++x) line.At(x, 2) = Pixel{100, 100, 200, 255};
  const TBitmap32 out = colorsketch(line, 45);
  EXPECT_EQ(out.At(3, 2), (Pixel{101, 101, 201, 255}));
  EXPECT_EQ(out.At(3, 0), kWhite);
  EXPECT_EQ(out.At(3, 1), kWhite);
  EXPECT_EQ(colorsketch(line, 0), TBitmap32(7, 5, kWhite));
}

TEST(ColorPencil, TablesGiveTheStepByStepBytesAtEveryPressure) {
  const TBitmap32 source = Varied(40, 23);
  for (int p = 0; p <= 89; ++p)
    ASSERT_EQ(colorsketch(source, p), ColorSketchReference(source, p)) << p;
  for (auto [w, h] : {std::pair{0, 0}, {1, 1}, {1, 6}, {6, 1}, {2, 5}, {5, 2}, {3, 3}})
    EXPECT_EQ(colorsketch(Varied(w, h), 70), ColorSketchReference(Varied(w, h), 70));
}

}  // namespace
}  // namespace quillane
