// Changing the shape of the document's pictures: the quarter turns of the rotation buttons and
// the resample of the image size dialog. Both act on the working and the source picture
// together and leave the picture as opened alone, so Renew undoes them.
#pragma once

#include <cstdint>

#include "document/document.h"
#include "imaging/rotate.h"

namespace quillane {

// Turns the working and the source picture by a quarter turn, each about its own centre
// (RotationCentre of its sides), then resets the history to the turned working picture. When
// either picture is too small to turn, nothing changes and the result is false.
bool RotateDocument(PictureDocument& document, QuarterTurn turn);

// The factors for resampling a W by H picture to w by h: w / W and h / H, each divided in
// extended precision and stored as a double. Since ResampleNearest truncates W * (w / W), a
// quotient rounded downward gives w - 1 (400 / 521 of 521 is 399).
struct SizeFactors {
  double width = 0;
  double height = 0;
};
SizeFactors ImageSizeFactors(int w, int h, int W, int H);

// What ResampleNearest makes of side with factor: Trunc(side * factor) in extended precision.
std::int64_t ResampledSide(int side, double factor);

enum class ResizeResult {
  Resized,
  TooSmall,  // a size of 0, or one that resamples to less than one pixel
  TooLarge,  // more pixels than Bitmap32::kMaxPixels
};

// Resamples the working and then the source picture with ResampleNearest by the factors for w by h
// taken from the working picture's size (the source picture may differ in size), then takes the
// history step. Anything but Resized leaves the document unchanged; so does a failed
// allocation, which passes on: NotEnoughMemory, with a sentence for the user, when the new
// size will not fit in the memory left.
ResizeResult ResizeDocument(PictureDocument& document, int w, int h);

}  // namespace quillane
