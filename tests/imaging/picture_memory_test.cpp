// Pictures in kept picture memory: copies, moves and the reuse of freed blocks.
#include "imaging/picture_memory.h"

#include <gtest/gtest.h>

#include "imaging/bitmap32.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

TEST(PictureMemory, CopiesAndMovesBetweenSizes) {
  // Sizes on either side of the block threshold (1 MiB = 262144 pixels).
  const std::pair<int, int> sizes[] = {{0, 0}, {1, 1}, {3, 2}, {512, 512}, {700, 400}};
  for (const auto& [fw, fh] : sizes)
    for (const auto& [tw, th] : sizes) {
      const Bitmap32 from = RandomPicture(fw, fh, 1);
      Bitmap32 to = RandomPicture(tw, th, 2);
      to = from;
      EXPECT_EQ(to, from) << fw << "x" << fh << " over " << tw << "x" << th;
      Bitmap32 moved = std::move(to);
      EXPECT_EQ(moved, from);
      EXPECT_TRUE(to.Empty());
      EXPECT_EQ(to.Height(), 0);
      moved = moved;  // NOLINT: assignment to itself keeps the picture
      EXPECT_EQ(moved, from);
    }
}

TEST(PictureMemory, FreedBlocksServeTheNextPictureOfTheirSize) {
#if defined(__SANITIZE_ADDRESS__)
  GTEST_SKIP() << "under AddressSanitizer every picture comes from the checked heap";
#endif
  SetUpPictureMemory();
  ReleasePictureMemory();
  const Pixel* first = nullptr;
  {
    const Bitmap32 picture(2000, 1000, Pixel{1, 2, 3, 4});
    first = picture.Data();
  }
  EXPECT_GE(KeptPictureBytes(), 2000u * 1000 * 4);
  {
    const Bitmap32 again = Bitmap32::ForOverwrite(2000, 1000);
    EXPECT_EQ(again.Data(), first);
    EXPECT_EQ(KeptPictureBytes(), 0u);
  }
  // A cleared picture is cleared even in a block that held another picture.
  const Bitmap32 cleared(2000, 1000);
  EXPECT_EQ(cleared.Data(), first);
  EXPECT_EQ(cleared.At(1999, 999), Pixel{});
  { const Bitmap32 other(1000, 1000); }
  ReleasePictureMemory(2000u * 1000 * 4);
  EXPECT_EQ(KeptPictureBytes(), 0u);
}

}  // namespace
}  // namespace quillane
