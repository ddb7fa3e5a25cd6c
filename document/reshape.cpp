#include "document/reshape.h"

#include <optional>
#include <utility>

#include "imaging/memory_budget.h"
#include "imaging/numeric.h"

namespace quillane {

bool RotateDocument(PictureDocument& document, QuarterTurn turn) {
  const auto turned = [turn](const Bitmap32& p) {
    return RotatePicture(p, RotationCentre(p.Width()), RotationCentre(p.Height()), turn);
  };
  std::optional<Bitmap32> working = turned(document.Working());
  if (!working) return false;
  if (document.WorkingIsSource()) {
    // A picture just opened or renewed: one turn serves both.
    document.SetWorkingAndSource(std::move(*working));
    document.ResetHistory();
    return true;
  }
  std::optional<Bitmap32> source = turned(document.Source());
  if (!source) return false;
  document.SetWorking(std::move(*working));
  document.SetSource(std::move(*source));
  document.ResetHistory();
  return true;
}

SizeFactors ImageSizeFactors(int w, int h, int W, int H) {
  return {static_cast<double>(static_cast<Extended>(w) / W),
          static_cast<double>(static_cast<Extended>(h) / H)};
}

std::int64_t ResampledSide(int side, double factor) {
  return static_cast<std::int64_t>(static_cast<Extended>(side) * factor);
}

ResizeResult ResizeDocument(PictureDocument& document, int w, int h) {
  const Bitmap32& working = document.Working();
  const Bitmap32& source = document.Source();
  if (w <= 0 || h <= 0 || working.Empty()) return ResizeResult::TooSmall;
  const SizeFactors f = ImageSizeFactors(w, h, working.Width(), working.Height());
  ResizeResult result = ResizeResult::Resized;
  for (const Bitmap32* p : {&working, &source}) {
    const std::int64_t newW = ResampledSide(p->Width(), f.width);
    const std::int64_t newH = ResampledSide(p->Height(), f.height);
    if (newW < 1 || newH < 1) return ResizeResult::TooSmall;
    if (newW > Bitmap32::kMaxPixels / newH) result = ResizeResult::TooLarge;
  }
  if (result != ResizeResult::Resized) return result;
  CheckMemoryFor(ResampledSide(working.Width(), f.width), ResampledSide(working.Height(), f.height),
                 "The resized picture");

  Bitmap32 newWorking = working;
  ResampleNearest(newWorking, f.height, f.width);
  if (document.WorkingIsSource()) {
    document.SetWorkingAndSource(std::move(newWorking));
  } else {
    Bitmap32 newSource = source;
    ResampleNearest(newSource, f.height, f.width);
    document.SetWorking(std::move(newWorking));
    document.SetSource(std::move(newSource));
  }
  document.Backup();
  return ResizeResult::Resized;
}

}  // namespace quillane
