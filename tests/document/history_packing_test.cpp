#include <gtest/gtest.h>

#include <cstdint>
#include <memory>
#include <vector>

#include "document/document.h"
#include "document/packed_picture.h"
#include "tests/imaging/random_picture.h"

namespace quillane {
namespace {

TEST(PackedPicture, GivesBackEveryByte) {
  // Awkward sizes, and one tall enough to be packed in several bands on several threads.
  const struct { int w, h; } sizes[] = {{0, 0}, {1, 1}, {1, 9}, {9, 1}, {7, 5}, {300, 2000}};
  for (const auto& size : sizes) {
    const Bitmap32 picture = RandomPicture(size.w, size.h, 7);
    const PackedPicture packed = PackedPicture::Pack(picture);
    EXPECT_EQ(packed.Unpack(), picture) << size.w << "x" << size.h;
    Bitmap32 reused = RandomPicture(size.w, size.h, 8);  // same size: its storage is overwritten
    packed.UnpackInto(reused);
    EXPECT_EQ(reused, picture) << size.w << "x" << size.h;
  }
  const Bitmap32 flat(1000, 1000, Pixel{255, 255, 255, 255});
  EXPECT_LT(PackedPicture::Pack(flat).Bytes(), flat.PixelCount() * 4 / 100);
}

// Each step has its own size, so undo moves between storage of different sizes as well.
TEST(PictureDocument, UndoAndRedoAfterPackingGiveBackTheExactStates) {
  std::vector<Bitmap32> states{RandomPicture(40, 30, 0)};
  PictureDocument doc(states[0]);
  for (std::uint32_t i = 1; i <= 24; ++i) {
    states.push_back(RandomPicture(40 + static_cast<int>(i % 3), 30, i));
    doc.SetWorking(states.back());
    doc.Backup();
    EXPECT_EQ(doc.Slot(doc.CurrentSlot()).Data(), doc.Working().Data());  // the same, not a copy
  }
  EXPECT_EQ(doc.UndoCount(), 20);
  PictureDocument::WaitForHistoryPacking();
  const PictureDocument copy = doc;
  const auto shown = doc.SharedWorking();  // a picture someone still holds must not change
  for (int i = 23; i >= 4; --i) {
    ASSERT_TRUE(doc.Undo());
    EXPECT_EQ(doc.Working(), states[static_cast<std::size_t>(i)]) << i;
    EXPECT_EQ(doc.UndoCount() + doc.RedoCount(), 20);
  }
  EXPECT_FALSE(doc.Undo());
  EXPECT_EQ(doc.Working(), states[4]);
  EXPECT_EQ(*shown, states[24]);
  for (int i = 5; i <= 24; ++i) {
    ASSERT_TRUE(doc.Redo());
    EXPECT_EQ(doc.Working(), states[static_cast<std::size_t>(i)]) << i;
  }
  EXPECT_FALSE(doc.Redo());
  EXPECT_EQ(copy.Working(), states[24]);
  EXPECT_EQ(copy.Slot(copy.CurrentSlot() == 1 ? 21 : copy.CurrentSlot() - 1), states[23]);
}

// Undo and Redo arrive while states are still being packed or made ready in the background,
// in every order a user may press them, and after the background went quiet; each gives the
// exact state. Once quiet, the states one step away are ready: the step shows that very
// picture instead of unpacking one.
TEST(PictureDocument, StepsDuringAndAfterBackgroundWorkGiveTheExactStates) {
  const char* walks[] = {"uuuu", "ururur", "uuurrruu", "uuuuuurrr", "ruuurur"};
  for (const bool waitEachStep : {false, true}) {
    for (const char* walk : walks) {
      std::vector<Bitmap32> states{RandomPicture(300, 400, 0)};
      PictureDocument doc(states[0]);
      for (std::uint32_t i = 1; i <= 8; ++i) {
        states.push_back(RandomPicture(300, 400 + static_cast<int>(i % 2), i));
        doc.SetWorking(states.back());
        doc.Backup();
      }
      std::size_t at = 8;
      for (const char* step = walk; *step != 0; ++step) {
        const bool undo = *step == 'u';
        if (!(undo ? doc.CanUndo() : doc.CanRedo())) {
          EXPECT_FALSE(undo ? doc.Undo() : doc.Redo());
          continue;
        }
        if (waitEachStep) {
          PictureDocument::WaitForHistoryPacking();
          const int next = undo ? (doc.CurrentSlot() == 1 ? 21 : doc.CurrentSlot() - 1)
                                : doc.CurrentSlot() % 21 + 1;
          const Pixel* ready = doc.Slot(next).Data();
          ASSERT_TRUE(undo ? doc.Undo() : doc.Redo()) << walk;
          EXPECT_EQ(doc.Working().Data(), ready) << walk << " at " << (step - walk);
        } else {
          ASSERT_TRUE(undo ? doc.Undo() : doc.Redo()) << walk;
        }
        at = undo ? at - 1 : at + 1;
        ASSERT_EQ(doc.Working(), states[at]) << walk << " at " << (step - walk);
      }
      // The state a step leaves is kept ready for the step back, even once packed.
      PictureDocument::WaitForHistoryPacking();
      const std::weak_ptr<const Bitmap32> left = doc.SharedWorking();
      if (doc.Undo() || doc.Redo()) {
        EXPECT_FALSE(left.expired()) << walk;
      }
    }
  }
}

TEST(PictureDocument, ANewStepAfterUndoDiscardsRedoAndLetsUnreachableStatesGo) {
  const auto flat = [](std::uint8_t v) { return Bitmap32(2, 2, Pixel{v, v, v, 255}); };
  PictureDocument doc(flat(1));
  for (std::uint8_t v = 2; v <= 4; ++v) {
    doc.SetWorking(flat(v));
    doc.Backup();
  }
  doc.Undo();
  doc.Undo();
  EXPECT_EQ(doc.RedoCount(), 2);
  doc.SetWorking(flat(9));
  doc.Backup();  // slot 3 now holds 9; slot 4 (state 4) can no longer be reached
  EXPECT_FALSE(doc.CanRedo());
  EXPECT_EQ(doc.CurrentSlot(), 3);
  EXPECT_EQ(doc.Slot(3), flat(9));
  EXPECT_TRUE(doc.Slot(4).Empty());
  EXPECT_EQ(doc.Slot(1), flat(1));
  doc.Undo();
  EXPECT_EQ(doc.Working(), flat(2));
}

}  // namespace
}  // namespace quillane
