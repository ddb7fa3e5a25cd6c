#include "document/document.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "document/reshape.h"
#include "document/run_effect.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

Bitmap32 Flat(int w, int h, std::uint8_t v) {
  return Bitmap32(w, h, Pixel{v, v, v, 255});
}

// One picture, held once: a 24-megapixel picture was held four times over once opened.
TEST(PictureDocument, StartsWithOnePictureEverywhereHeldOnce) {
  PictureDocument doc(Bitmap32(3, 2, Pixel{1, 2, 3, 0}));
  EXPECT_EQ(doc.Working(), Bitmap32(3, 2, Pixel{1, 2, 3, 255}));
  for (const Bitmap32* p : {&doc.Source(), &doc.Opened(), &doc.Slot(1)})
    EXPECT_EQ(p->Data(), doc.Working().Data());
  EXPECT_FALSE(doc.CanUndo());
  EXPECT_FALSE(doc.CanRedo());
  EXPECT_EQ(doc.CurrentSlot(), 1);
}

// A one-shot command's document keeps no history: it must still make exactly the pictures a
// document with history makes, whether the turn or resample meets one picture that is both
// working and source, or two that differ after an effect.
TEST(PictureDocument, WithoutHistoryMakesTheSamePicturesAndRecordsNothing) {
  using Step = std::function<void(PictureDocument&)>;
  const Step emboss = [](PictureDocument& d) {
    RunEffect(d, *FindEffectByCliName("emboss"), {}, true);
  };
  const Step turn = [](PictureDocument& d) {
    ASSERT_TRUE(RotateDocument(d, QuarterTurn::Clockwise));
  };
  const Step resize = [](PictureDocument& d) {
    ASSERT_EQ(ResizeDocument(d, 11, 30), ResizeResult::Resized);
  };
  const struct {
    std::string name;
    std::vector<Step> steps;
  } cases[] = {
      {"effect", {emboss}},
      {"turn", {turn}},
      {"resize", {resize}},
      {"effect, turn", {emboss, turn}},
      {"effect, resize", {emboss, resize}},
      {"turn, resize, effect", {turn, resize, emboss}},
  };
  Bitmap32 photo = RandomPicture(37, 23, 3);
  SetAlphaChannel(photo, 255);
  for (const auto& c : cases) {
    PictureDocument kept(photo);
    PictureDocument none(photo, PictureDocument::History::None);
    for (const Step& step : c.steps) {
      step(kept);
      step(none);
    }
    EXPECT_EQ(none.Working(), kept.Working()) << c.name;
    EXPECT_EQ(none.Source(), kept.Source()) << c.name;
    EXPECT_FALSE(none.CanUndo()) << c.name;
    EXPECT_FALSE(none.Undo()) << c.name;
    EXPECT_TRUE(none.Slot(none.CurrentSlot()).Empty()) << c.name;
  }

  // The single turn and resample of a fresh picture are those of the routines themselves.
  PictureDocument turned(photo, PictureDocument::History::None);
  turn(turned);
  EXPECT_EQ(turned.Working(),
            *RotatePicture(photo, RotationCentre(37), RotationCentre(23), QuarterTurn::Clockwise));
  EXPECT_EQ(turned.Source(), turned.Working());
  PictureDocument resized(photo);
  resize(resized);
  Bitmap32 expected = photo;
  const SizeFactors f = ImageSizeFactors(11, 30, 37, 23);
  ResampleNearest(expected, f.height, f.width);
  EXPECT_EQ(resized.Working(), expected);
  EXPECT_EQ(resized.Source(), expected);
  ASSERT_TRUE(resized.Undo());
  EXPECT_EQ(resized.Working(), photo);
}

TEST(PictureDocument, UndoAfterResizeResamplesSourceOnlyWhenWidthDiffers) {
  PictureDocument doc(Flat(10, 10, 0));
  // A smaller picture recorded, then the larger state restored by Undo: the source follows.
  doc.SetWorking(Flat(7, 7, 1));
  doc.SetSource(Flat(7, 7, 1));
  doc.Backup();
  doc.Undo();
  EXPECT_EQ(doc.Working().Width(), 10);
  // 7 * (10 / 7) may land just below 10 and truncate: that size or one less.
  EXPECT_GE(doc.Source().Width(), 9);
  EXPECT_LE(doc.Source().Width(), 10);

  PictureDocument tall(Flat(10, 10, 0));
  tall.SetWorking(Flat(10, 4, 1));
  tall.SetSource(Flat(10, 4, 1));
  tall.Backup();
  tall.Undo();
  EXPECT_EQ(tall.Working().Height(), 10);
  EXPECT_EQ(tall.Source().Height(), 4);  // heights are not compared
}

// Factors that are exact in binary (1/2 across, 1/4 down, and back), so the sizes are exact and
// a height factor applied to the width would show.
TEST(PictureDocument, UndoAndRedoOnANonSquarePictureRestoreWidthAndHeightInOrder) {
  PictureDocument doc(Flat(21, 13, 0));
  doc.SetWorking(Flat(42, 52, 1));
  doc.SetSource(Flat(42, 52, 2));
  doc.Backup();
  ASSERT_TRUE(doc.Undo());
  EXPECT_EQ(doc.Working(), Flat(21, 13, 0));
  EXPECT_EQ(doc.Source(), Flat(21, 13, 2));
  ASSERT_TRUE(doc.Redo());
  EXPECT_EQ(doc.Working(), Flat(42, 52, 1));
  EXPECT_EQ(doc.Source(), Flat(42, 52, 2));
}

TEST(PictureDocument, RenewRestoresOpenedPictureAndResetsHistory) {
  PictureDocument doc(Flat(4, 3, 5));
  doc.SetWorking(Flat(3, 4, 6));
  doc.SetSource(Flat(3, 4, 6));
  doc.Backup();
  doc.Renew();
  EXPECT_EQ(doc.Working(), Flat(4, 3, 5));
  EXPECT_EQ(doc.Source(), Flat(4, 3, 5));
  EXPECT_FALSE(doc.CanUndo());
  EXPECT_EQ(doc.CurrentSlot(), 1);
  EXPECT_EQ(doc.Slot(1), Flat(4, 3, 5));
}

TEST(PictureDocument, LoadReplacesPicturesButKeepsHistory) {
  PictureDocument doc(Flat(2, 2, 0));
  doc.SetWorking(Flat(2, 2, 1));
  doc.Backup();
  doc.Load(Bitmap32(5, 1, Pixel{1, 1, 1, 0}));
  EXPECT_EQ(doc.Opened(), Bitmap32(5, 1, Pixel{1, 1, 1, 255}));
  EXPECT_EQ(doc.UndoCount(), 1);
}

}  // namespace
}  // namespace quillane
