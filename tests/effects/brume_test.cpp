#include "effects/paint/brume.h"

#include <gtest/gtest.h>

namespace quillane {
namespace {

// Every pixel a colour of its own, so a copied pixel tells where it came from; alpha 7.
Bitmap32 Numbered(int w, int h) {
  Bitmap32 b(w, h);
  for (int y = 0; y < h; ++y)
    for (int x = 0; x < w; ++x)
      b.At(x, y) = Pixel{static_cast<std::uint8_t>(x), static_cast<std::uint8_t>(x >> 8),
                         static_cast<std::uint8_t>(y), 7};
  return b;
}

TEST(Brume, TheFirstDrawsAfterStartPickTheKnownPixelsAndTheNextRunGoesOn) {
  std::uint32_t seed = 0;
  for (std::uint32_t expected : {0u, 0u, 5u, 1u, 1u, 4u}) EXPECT_EQ(RandomDraw(seed, 6), expected);

  seed = 0;
  const Bitmap32 source = Numbered(5, 4);
  const Bitmap32 out = Brume(source, 3, seed);
  const auto opaque = [](Pixel p) { return Pixel{p.b, p.g, p.r, 255}; };
  EXPECT_EQ(out.At(1, 1), opaque(source.At(0, 0)));
  EXPECT_EQ(out.At(2, 1), opaque(source.At(0, 3)));
  EXPECT_EQ(out.At(3, 1), opaque(source.At(4, 0)));
  EXPECT_EQ(out.At(4, 0), source.At(4, 0));  // row 0 and column 0 are never written
  EXPECT_EQ(out.At(0, 2), source.At(0, 2));
  EXPECT_EQ(seed, RandomJump(0, 2 * 4 * 3));
  EXPECT_NE(Brume(source, 3, seed), out);
}

// Bands start their rows' draws by jumping ahead; the jump is the same as stepping.
TEST(Brume, AJumpAheadIsThatManyDraws) {
  std::uint32_t stepped = 12345;
  for (int i = 0; i < 1000; ++i) RandomDraw(stepped, 1);
  EXPECT_EQ(RandomJump(12345, 1000), stepped);
}

}  // namespace
}  // namespace quillane
