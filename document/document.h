// The picture document: the working picture the user sees, the source picture every effect
// reads, the picture as last opened, and the ring of history slots that Undo and Redo walk.
// Plain C++; the main window owns one and shows it.
//
// The pictures are shared, never copied: after opening, the working, source and opened picture
// and the first history slot are one bitmap in memory, and each history step holds the result
// it recorded. A picture is only ever replaced as a whole, so sharing is invisible to callers.
#pragma once

#include <array>
#include <cstdint>
#include <memory>

#include "imaging/bitmap32.h"

namespace quillane {

class PictureDocument {
 public:
  static constexpr int kSlots = 21;
  static constexpr int kMaxSteps = kSlots - 1;

  // Starts with picture (its alpha set to 255) as working, source and opened picture and in
  // slot 1.
  explicit PictureDocument(TBitmap32 picture = TBitmap32());

  const TBitmap32& Working() const { return *working_; }
  const TBitmap32& Source() const { return *source_; }
  const TBitmap32& Opened() const { return *opened_; }

  // Effects write their result here; record it with Backup afterwards.
  void SetWorking(TBitmap32 picture) { working_ = Share(std::move(picture)); }
  // Rotation and resizing change the source picture as well.
  void SetSource(TBitmap32 picture) { source_ = Share(std::move(picture)); }

  // Makes picture (alpha set to 255) the working, source and opened picture, as loading a file
  // does. The history is left alone; opening a file follows this with ResetHistory.
  void Load(TBitmap32 picture);

  // The history step: the next slot (21 wraps to 1) takes the working picture; the undo count
  // grows up to 20, the redo count becomes 0.
  void Backup();
  // One step back or forward; false (and nothing changed) when there is none. After a step
  // whose picture has another width than the source picture, the source picture is resampled
  // by the ratios of the two sizes.
  bool Undo();
  bool Redo();
  // Working and source picture back to the opened picture, and the history reset.
  void Renew();
  // Slot 1 takes the working picture; undo and redo counts become 0.
  void ResetHistory();

  bool CanUndo() const { return undoCount_ > 0; }
  bool CanRedo() const { return redoCount_ > 0; }
  int UndoCount() const { return undoCount_; }
  int RedoCount() const { return redoCount_; }
  int CurrentSlot() const { return currentSlot_; }  // 1..21
  const TBitmap32& Slot(int slot) const { return *slots_.at(static_cast<std::size_t>(slot - 1)); }

  // The random generator state the effects that draw continue: 0 when the document is made,
  // never reseeded by loading or history, so every run follows on from the one before.
  std::uint32_t& RandomState() { return randomState_; }
  std::uint32_t RandomState() const { return randomState_; }

 private:
  using Picture = std::shared_ptr<const TBitmap32>;
  static Picture Share(TBitmap32 picture) {
    return std::make_shared<const TBitmap32>(std::move(picture));
  }
  void RestoreCurrentSlot();

  Picture working_;
  Picture source_;
  Picture opened_;
  std::array<Picture, kSlots> slots_;
  int currentSlot_ = 1;
  int undoCount_ = 0;
  int redoCount_ = 0;
  std::uint32_t randomState_ = 0;
};

}  // namespace quillane
