#include "document/document.h"

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

#include "document/packed_picture.h"
#include "imaging/picture_memory.h"

namespace quillane {

// One history state. It starts as the recorded picture itself; once packed, only a weak
// reference to that picture is kept, which finds it again while a document still shows it.
// Packing is the only change a state ever sees, and it does not change what the state holds.
// A state next to the document's current one is also kept unpacked (ready), so that one Undo
// or Redo shows it without waiting for the unpacking.
struct PictureDocument::SlotState {
  explicit SlotState(Picture picture) : seen(picture), picture(std::move(picture)) {}
  std::mutex mutex;
  std::condition_variable unpacked;
  std::weak_ptr<const Bitmap32> seen;
  Picture picture;  // until packed
  std::shared_ptr<const PackedPicture> packed;
  Picture ready;
  bool wanted = false;     // next to the current state: worth keeping ready
  bool queued = false;     // to be made ready on the background thread, into aheadStorage
  bool unpacking = false;  // being made ready on the background thread
  Bitmap32 aheadStorage;
};

namespace {

// The one background thread that packs history states, in the order they were recorded, and
// unpacks the states next to the current one ahead of need. It can be held back for a moment
// while the window shows the result of an action.
class HistoryPacker {
 public:
  using Job = std::function<void()>;

  static HistoryPacker& Instance() {
    static HistoryPacker packer;
    return packer;
  }

  void Add(Job job) {
    {
      std::lock_guard lock(mutex_);
      if (!thread_.joinable()) thread_ = std::thread([this] { Run(); });
      jobs_.push_back(std::move(job));
    }
    wake_.notify_all();
  }

  void WaitUntilIdle() {
    std::unique_lock lock(mutex_);
    heldUntil_ = {};
    wake_.notify_all();
    idle_.wait(lock, [this] { return jobs_.empty() && !busy_; });
  }

  void Hold(std::chrono::milliseconds longest) {
    std::lock_guard lock(mutex_);
    heldUntil_ = std::chrono::steady_clock::now() + longest;
  }

  void Resume() {
    {
      std::lock_guard lock(mutex_);
      heldUntil_ = {};
    }
    wake_.notify_all();
  }

  ~HistoryPacker() {
    {
      std::lock_guard lock(mutex_);
      stop_ = true;
      jobs_.clear();
    }
    wake_.notify_all();
    if (thread_.joinable()) thread_.join();
  }

 private:
  HistoryPacker() = default;

  void Run() {
    std::unique_lock lock(mutex_);
    for (;;) {
      wake_.wait(lock, [this] { return stop_ || !jobs_.empty(); });
      if (stop_) return;
      if (std::chrono::steady_clock::now() < heldUntil_) {
        wake_.wait_until(lock, heldUntil_);
        continue;
      }
      Job job = std::move(jobs_.front());
      jobs_.pop_front();
      busy_ = true;
      lock.unlock();
      job();
      job = nullptr;
      lock.lock();
      busy_ = false;
      if (jobs_.empty()) idle_.notify_all();
    }
  }

  std::mutex mutex_;
  std::condition_variable wake_;
  std::condition_variable idle_;
  std::deque<Job> jobs_;
  bool busy_ = false;
  bool stop_ = false;
  std::chrono::steady_clock::time_point heldUntil_;
  std::thread thread_;
};

const Bitmap32& EmptyPicture() {
  static const Bitmap32 empty;
  return empty;
}

}  // namespace

PictureDocument::PictureDocument(Bitmap32 picture, History history)
    : keepsHistory_(history == History::Kept) {
  Load(std::move(picture));
  ResetHistory();
}

void PictureDocument::WaitForHistoryPacking() {
  HistoryPacker::Instance().WaitUntilIdle();
}

void PictureDocument::HoldBackgroundWork(std::chrono::milliseconds longest) {
  HistoryPacker::Instance().Hold(longest);
}

void PictureDocument::ResumeBackgroundWork() {
  HistoryPacker::Instance().Resume();
}

PictureDocument::SlotHandle PictureDocument::Record(Picture picture) {
  auto slot = std::make_shared<SlotState>(std::move(picture));
  HistoryPacker::Instance().Add([weak = std::weak_ptr<SlotState>(slot)] {
    const SlotHandle slot = weak.lock();
    if (!slot) return;  // overwritten before its turn came
    Picture picture;
    {
      std::lock_guard lock(slot->mutex);
      picture = slot->picture;
    }
    if (!picture) return;
    std::shared_ptr<const PackedPicture> packed;
    try {
      packed = std::make_shared<const PackedPicture>(PackedPicture::Pack(*picture));
    } catch (const std::exception&) {
      return;  // short of memory: the state simply stays unpacked
    }
    std::lock_guard lock(slot->mutex);
    slot->packed = std::move(packed);
    slot->picture.reset();
  });
  return slot;
}

const Bitmap32& PictureDocument::Slot(int slot) const {
  const SlotHandle& state = slots_.at(static_cast<std::size_t>(slot - 1));
  if (!state) return EmptyPicture();
  std::shared_ptr<const PackedPicture> packed;
  {
    std::lock_guard lock(state->mutex);
    slotView_ = state->picture ? state->picture : state->seen.lock();
    packed = state->packed;
  }
  if (!slotView_) slotView_ = Share(packed->Unpack());
  return *slotView_;
}

void PictureDocument::Load(Bitmap32 picture) {
  spare_.storage = Bitmap32();
  SetAlphaChannel(picture, 255);
  working_ = source_ = opened_ = Share(std::move(picture));
}

void PictureDocument::Load(std::shared_ptr<Bitmap32> picture) {
  spare_.storage = Bitmap32();
  working_ = source_ = opened_ = std::move(picture);
}

void PictureDocument::Backup() {
  spare_.storage = Bitmap32();
  if (!keepsHistory_) return;
  currentSlot_ = currentSlot_ % kSlots + 1;
  SlotAt(currentSlot_) = Record(working_);
  if (undoCount_ < kMaxSteps) ++undoCount_;
  redoCount_ = 0;
  LetGoOfUnreachableSlots();
  KeepNeighboursReady();
}

PictureDocument::Picture PictureDocument::TakeSlot(int target) {
  SlotState& state = *SlotAt(target);
  std::shared_ptr<const PackedPicture> packed;
  {
    std::unique_lock lock(state.mutex);
    // Unpacking it twice would only slow both down.
    state.unpacked.wait(lock, [&] { return !state.unpacking; });
    if (state.ready) return state.ready;
    if (Picture shown = state.picture ? state.picture : state.seen.lock()) return shown;
    packed = state.packed;
    // Wanted now: the background's turn may be far off, so its storage is taken back.
    if (state.queued) {
      state.queued = false;
      if (spare_.storage.Empty()) spare_.storage = std::move(state.aheadStorage);
      state.aheadStorage = Bitmap32();
    }
  }
  Bitmap32 storage = std::move(spare_.storage);
  spare_.storage = Bitmap32();
  packed->UnpackInto(storage);
  Picture picture = Share(std::move(storage));
  std::lock_guard lock(state.mutex);
  if (Picture shown = state.seen.lock()) return shown;  // made ready meanwhile
  state.seen = picture;
  return picture;
}

void PictureDocument::KeepNeighboursReady() {
  const int back = currentSlot_ == 1 ? kSlots : currentSlot_ - 1;
  const int forward = currentSlot_ % kSlots + 1;
  for (int slot = 1; slot <= kSlots; ++slot) {
    const SlotHandle& state = SlotAt(slot);
    if (!state) continue;
    const bool wanted = (slot == back && undoCount_ > 0) || (slot == forward && redoCount_ > 0);
    std::shared_ptr<const PackedPicture> packed;
    {
      std::lock_guard lock(state->mutex);
      state->wanted = wanted;
      if (!wanted) {
        if (state->queued) {
          state->queued = false;
          if (spare_.storage.Empty()) spare_.storage = std::move(state->aheadStorage);
          state->aheadStorage = Bitmap32();
        }
        Picture released = std::move(state->ready);
        state->ready.reset();
        // Nobody else holds it, and nobody can find it while the lock is held: its storage
        // serves the next state to be unpacked.
        if (released && released.use_count() == 1 && spare_.storage.Empty()) {
          state->seen.reset();
          spare_.storage = std::move(const_cast<Bitmap32&>(*released));
        }
        continue;
      }
      if (state->ready || state->unpacking || state->queued) continue;
      state->ready = state->picture ? state->picture : state->seen.lock();
      if (state->ready || !state->packed) continue;
      packed = state->packed;
      state->queued = true;
      state->aheadStorage = std::move(spare_.storage);
      spare_.storage = Bitmap32();
    }
    UnpackAhead(state, std::move(packed));
  }
}

void PictureDocument::UnpackAhead(const SlotHandle& state,
                                  std::shared_ptr<const PackedPicture> packed) {
  HistoryPacker::Instance().Add([weak = std::weak_ptr<SlotState>(state), packed] {
    const SlotHandle slot = weak.lock();
    if (!slot) return;
    Bitmap32 storage;
    {
      std::lock_guard lock(slot->mutex);
      if (!slot->queued) return;  // taken back, or no longer wanted
      slot->queued = false;
      storage = std::move(slot->aheadStorage);
      slot->aheadStorage = Bitmap32();
      if (!slot->wanted || slot->ready) return;
      if ((slot->ready = slot->seen.lock())) return;
      slot->unpacking = true;
    }
    Picture picture;
    try {
      packed->UnpackInto(storage);
      picture = Share(std::move(storage));
    } catch (const std::exception&) {
      // Short of memory: Undo or Redo unpacks it when it comes.
    }
    {
      std::lock_guard lock(slot->mutex);
      slot->unpacking = false;
      if (picture && slot->wanted) {
        if (Picture shown = slot->seen.lock()) {
          slot->ready = std::move(shown);
        } else {
          slot->seen = picture;
          slot->ready = std::move(picture);
        }
      }
    }
    slot->unpacked.notify_all();
  });
}

void PictureDocument::Restore(int target) {
  working_ = TakeSlot(target);
  currentSlot_ = target;
  // Only the widths are compared: a change of height alone leaves the source as it is.
  if (working_->Width() != source_->Width() && !source_->Empty()) {
    const long double heightFactor =
        static_cast<long double>(working_->Height()) / source_->Height();
    const long double widthFactor = static_cast<long double>(working_->Width()) / source_->Width();
    Bitmap32 resampled = *source_;
    ResampleNearest(resampled, heightFactor, widthFactor);
    source_ = Share(std::move(resampled));
  }
}

bool PictureDocument::Undo() {
  if (undoCount_ == 0) return false;
  const Picture leaving = working_;  // the state Redo goes back to: kept ready
  Restore(currentSlot_ == 1 ? kSlots : currentSlot_ - 1);
  --undoCount_;
  ++redoCount_;
  KeepNeighboursReady();
  return true;
}

bool PictureDocument::Redo() {
  if (redoCount_ == 0) return false;
  const Picture leaving = working_;  // the state Undo goes back to: kept ready
  Restore(currentSlot_ % kSlots + 1);
  ++undoCount_;
  --redoCount_;
  KeepNeighboursReady();
  return true;
}

void PictureDocument::Renew() {
  working_ = opened_;
  source_ = opened_;
  ResetHistory();
}

void PictureDocument::ResetHistory() {
  currentSlot_ = 1;
  undoCount_ = 0;
  redoCount_ = 0;
  if (keepsHistory_) SlotAt(1) = Record(working_);
  LetGoOfUnreachableSlots();
  KeepNeighboursReady();
  // The memory kept for pictures of another size goes back to the system with the slots let go;
  // with a history, behind the packing of the new first state, so that the picture is shown
  // first.
  const std::size_t fitting = working_->PixelCount() * sizeof(Pixel);
  if (keepsHistory_)
    HistoryPacker::Instance().Add([fitting] { ReleasePictureMemory(fitting); });
  else
    ReleasePictureMemory(fitting);
}

void PictureDocument::LetGoOfUnreachableSlots() {
  // The reachable slots run from undo count steps back to redo count steps forward.
  for (int offset = redoCount_ + 1; offset < kSlots - undoCount_; ++offset)
    SlotAt((currentSlot_ - 1 + offset) % kSlots + 1).reset();
}

}  // namespace quillane
