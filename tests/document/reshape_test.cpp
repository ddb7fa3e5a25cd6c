#include "document/reshape.h"

#include <gtest/gtest.h>

namespace quillane {
namespace {

TBitmap32 Flat(int w, int h, std::uint8_t v) {
  return TBitmap32(w, h, Pixel{v, v, v, 255});
}

TEST(ImageSize, NewSidesFollowTheRoundedQuotient) {
  struct Case {
    int w, h, W, H;
    std::int64_t newW, newH;
  };
  const Case cases[] = {
      {400, 266, 521, 346, 399, 266},  // 400 / 521 rounds downward as a double
      {320, 240, 640, 480, 320, 240}, {1, 346, 521, 346, 0, 346},
      {417, 277, 521, 346, 417, 276}, {651, 432, 521, 346, 651, 432},
  };
  for (const Case& c : cases) {
    const SizeFactors f = ImageSizeFactors(c.w, c.h, c.W, c.H);
    EXPECT_EQ(ResampledSide(c.W, f.width), c.newW) << c.w << " of " << c.W;
    EXPECT_EQ(ResampledSide(c.H, f.height), c.newH) << c.h << " of " << c.H;
  }
}

TEST(ImageSize, ResizesBothPicturesAndTakesAHistoryStep) {
  PictureDocument doc(Flat(521, 346, 9));
  doc.SetSource(Flat(260, 173, 3));  // the source may differ; it follows the same factors
  ASSERT_EQ(ResizeDocument(doc, 400, 266), ResizeResult::Resized);
  EXPECT_EQ(doc.Working(), Flat(399, 266, 9));
  EXPECT_EQ(doc.Source(), Flat(199, 133, 3));
  EXPECT_EQ(doc.UndoCount(), 1);
  EXPECT_EQ(doc.Opened(), Flat(521, 346, 9));
}

TEST(ImageSize, SizesThatCannotBeMadeChangeNothing) {
  PictureDocument doc(Flat(521, 346, 9));
  doc.SetSource(Flat(5, 346, 9));
  struct Case {
    int w, h;
    ResizeResult result;
  };
  const Case cases[] = {
      {0, 100, ResizeResult::TooSmall},          {100, 0, ResizeResult::TooSmall},
      {1, 346, ResizeResult::TooSmall},    // 1 / 521 of 521 is 0
      {100, 346, ResizeResult::TooSmall},  // the working picture would do; the source would not
      {2000000000, 346, ResizeResult::TooLarge}, {30000, 20000, ResizeResult::TooLarge},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(ResizeDocument(doc, c.w, c.h), c.result) << c.w << "x" << c.h;
    EXPECT_EQ(doc.Working(), Flat(521, 346, 9));
    EXPECT_EQ(doc.Source(), Flat(5, 346, 9));
    EXPECT_FALSE(doc.CanUndo());
  }
}

TEST(Rotation, TurnsWorkingAndSourceAndResetsTheHistory) {
  PictureDocument doc(Flat(640, 480, 1));
  doc.SetSource(Flat(101, 57, 2));
  doc.SetWorking(Flat(640, 480, 3));
  doc.Backup();
  ASSERT_TRUE(RotateDocument(doc, QuarterTurn::Clockwise));
  EXPECT_EQ(doc.Working(), Flat(478, 640, 3));
  EXPECT_EQ(doc.Source(), Flat(57, 101, 2));
  EXPECT_EQ(doc.Opened(), Flat(640, 480, 1));
  EXPECT_FALSE(doc.CanUndo());
  EXPECT_EQ(doc.Slot(1), doc.Working());

  // A picture too thin to turn leaves both as they were, the history too.
  doc.SetSource(Flat(2, 1, 4));
  doc.Backup();
  EXPECT_FALSE(RotateDocument(doc, QuarterTurn::Anticlockwise));
  EXPECT_EQ(doc.Working(), Flat(478, 640, 3));
  EXPECT_EQ(doc.Source(), Flat(2, 1, 4));
  EXPECT_TRUE(doc.CanUndo());
}

}  // namespace
}  // namespace quillane
