// The picture document: the working picture the user sees, the source picture every effect
// reads, the picture as last opened, and the ring of history slots that Undo and Redo walk.
// Plain C++; the main window owns one and shows it.
//
// The pictures are shared, never copied: after opening, the working, source and opened picture
// and the first history slot are one bitmap in memory, and each history step holds the result
// it recorded. A picture is only ever replaced as a whole, so sharing is invisible to callers.
//
// History states are packed losslessly on a background thread once recorded; a state that no
// document picture shows any more is then held only packed, so twenty steps of a large picture
// fit in memory. The states one Undo and one Redo away are kept unpacked as well (made ready
// on the background thread when needed), so that a step through the history shows its picture
// at once; stepping further than the background has prepared unpacks on the spot. States that
// can no longer be reached by Undo or Redo are let go.
//
// A document and the copies made of it are used from one thread at a time.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <memory>

#include "imaging/bitmap32.h"

namespace quillane {

class PackedPicture;

class PictureDocument {
 public:
  static constexpr int kSlots = 21;
  static constexpr int kMaxSteps = kSlots - 1;

  // Whether the document records history states. A one-shot command can never undo, so it
  // runs without: its pictures are then never packed or kept for Undo, and Backup and
  // ResetHistory leave the slots empty and the counts at 0.
  enum class History { Kept, None };

  // Starts with picture (its alpha set to 255) as working, source and opened picture and in
  // slot 1.
  explicit PictureDocument(Bitmap32 picture = Bitmap32(), History history = History::Kept);

  const Bitmap32& Working() const { return *working_; }
  const Bitmap32& Source() const { return *source_; }
  const Bitmap32& Opened() const { return *opened_; }

  // Effects write their result here; record it with Backup afterwards.
  void SetWorking(Bitmap32 picture) { working_ = Share(std::move(picture)); }
  // Rotation and resizing change the source picture as well.
  void SetSource(Bitmap32 picture) { source_ = Share(std::move(picture)); }
  // Both at once, as one picture, when a change of shape made the same result of both.
  void SetWorkingAndSource(Bitmap32 picture) { working_ = source_ = Share(std::move(picture)); }
  // True while the working and the source picture are one picture in memory, so that work
  // done on both need be done once.
  bool WorkingIsSource() const { return working_ == source_; }

  // Makes picture (alpha set to 255) the working, source and opened picture, as loading a file
  // does. The history is left alone; opening a file follows this with ResetHistory.
  void Load(Bitmap32 picture);
  // The same for a picture whose alpha is 255 already, taken over without a copy.
  void Load(std::shared_ptr<Bitmap32> picture);

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
  // The state held in slot (1..21), unpacked when it is packed; empty for a slot no history
  // operation can reach. The reference holds until the next call or change of the document.
  const Bitmap32& Slot(int slot) const;

  // Shared handles on the pictures, for work that runs on another thread while the document
  // goes on: the pictures themselves never change.
  std::shared_ptr<const Bitmap32> SharedSource() const { return source_; }
  std::shared_ptr<const Bitmap32> SharedWorking() const { return working_; }

  // Waits until every history state recorded so far (by any document) is packed, and the
  // states next to the current ones are unpacked; a hold ends first.
  static void WaitForHistoryPacking();
  // The background work waits (at most longest, or until ResumeBackgroundWork), so that it
  // does not compete with showing what an action has just made.
  static void HoldBackgroundWork(std::chrono::milliseconds longest);
  static void ResumeBackgroundWork();

  // The random generator state the effects that draw continue: 0 when the document is made,
  // never reseeded by loading or history, so every run follows on from the one before.
  std::uint32_t& RandomState() { return randomState_; }
  std::uint32_t RandomState() const { return randomState_; }

 private:
  using Picture = std::shared_ptr<const Bitmap32>;
  // Made writable, so that a picture nobody else holds can lend its storage to the next one.
  static Picture Share(Bitmap32 picture) { return std::make_shared<Bitmap32>(std::move(picture)); }
  struct SlotState;
  using SlotHandle = std::shared_ptr<SlotState>;
  SlotHandle& SlotAt(int slot) { return slots_[static_cast<std::size_t>(slot - 1)]; }
  const SlotHandle& SlotAt(int slot) const { return slots_[static_cast<std::size_t>(slot - 1)]; }
  static SlotHandle Record(Picture picture);
  // The picture of slot target: the one kept ready or still shown, or else unpacked now.
  Picture TakeSlot(int target);
  // The states one Undo and one Redo away are kept unpacked, the others let go of their
  // unpacked pictures; a packed neighbour is unpacked on the background thread.
  void KeepNeighboursReady();
  // Queues the unpacking of a state marked queued, into the storage it was given.
  void UnpackAhead(const SlotHandle& state, std::shared_ptr<const PackedPicture> packed);
  void Restore(int target);
  void LetGoOfUnreachableSlots();

  // Storage of a state that stopped being kept ready, for the next state to be unpacked while
  // stepping through the history. A copy of the document starts without one.
  struct Spare {
    Spare() = default;
    Spare(const Spare&) {}
    Spare& operator=(const Spare&) { return *this; }
    Bitmap32 storage;
  };

  Picture working_;
  Picture source_;
  Picture opened_;
  std::array<SlotHandle, kSlots> slots_;
  mutable Picture slotView_;
  Spare spare_;
  int currentSlot_ = 1;
  int undoCount_ = 0;
  int redoCount_ = 0;
  std::uint32_t randomState_ = 0;
  bool keepsHistory_ = true;
};

}  // namespace quillane
