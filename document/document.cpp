#include "document/document.h"

#include <algorithm>

#include "imaging/picture_memory.h"

namespace quillane {

PictureDocument::PictureDocument(TBitmap32 picture) {
  const Picture empty = Share(TBitmap32());
  slots_.fill(empty);
  Load(std::move(picture));
  ResetHistory();
}

void PictureDocument::Load(TBitmap32 picture) {
  SetAlphaChannel(picture, 255);
  working_ = source_ = opened_ = Share(std::move(picture));
}

void PictureDocument::Backup() {
  currentSlot_ = currentSlot_ % kSlots + 1;
  slots_[static_cast<std::size_t>(currentSlot_ - 1)] = working_;
  if (undoCount_ < kMaxSteps) ++undoCount_;
  redoCount_ = 0;
}

void PictureDocument::RestoreCurrentSlot() {
  working_ = slots_[static_cast<std::size_t>(currentSlot_ - 1)];
  // Only the widths are compared: a change of height alone leaves the source as it is.
  if (working_->Width() != source_->Width() && !source_->Empty()) {
    const long double heightFactor =
        static_cast<long double>(working_->Height()) / source_->Height();
    const long double widthFactor = static_cast<long double>(working_->Width()) / source_->Width();
    TBitmap32 resampled = *source_;
    ZoomInandOut(resampled, heightFactor, widthFactor);
    source_ = Share(std::move(resampled));
  }
}

bool PictureDocument::Undo() {
  if (undoCount_ == 0) return false;
  currentSlot_ = currentSlot_ == 1 ? kSlots : currentSlot_ - 1;
  RestoreCurrentSlot();
  --undoCount_;
  ++redoCount_;
  return true;
}

bool PictureDocument::Redo() {
  if (redoCount_ == 0) return false;
  currentSlot_ = currentSlot_ % kSlots + 1;
  RestoreCurrentSlot();
  ++undoCount_;
  --redoCount_;
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
  // No step can reach the other slots any more: their pictures are let go, and the memory
  // kept for pictures of another size goes back to the system with them.
  std::fill(slots_.begin(), slots_.end(), Share(TBitmap32()));
  slots_[0] = working_;
  ReleasePictureMemory(working_->PixelCount() * sizeof(Pixel));
}

}  // namespace quillane
