// Quarter turns of a picture. The picture is turned inside the canvas that circumscribes it and
// the canvas is then trimmed back symmetrically, so a turned picture is not always exactly its
// height by its width: with a rounded centre, a row or column can be lost on one side or a
// column of fill colour added on the other.
#pragma once

#include <optional>

#include "imaging/bitmap32.h"

namespace quillane {

enum class QuarterTurn { Clockwise, Anticlockwise };

// What the turn leaves where no picture pixel lands: the paper tint (red 236, green 233,
// blue 216) with alpha 0.
inline constexpr Pixel kRotationFill{216, 233, 236, 0};

// Turns source (W by H) by a quarter turn about (cx, cy):
//   D = sqrt(W*W + H*H) in extended precision, padX = Round((D - W) / 2),
//   padY = Round((D - H) / 2); canvas A is source with padX fill columns on either side and
//   padY fill rows above and below; ax = cx + padX, ay = cy + padY.
//   Canvas B has A's size, B(x, y) = A(ax + (y - ay), ay - (x - ax)) clockwise or
//   A(ax - (y - ay), ay + (x - ax)) anticlockwise, kRotationFill where that falls outside A.
//   top / left = the first row / column of B holding a pixel that differs from kRotationFill
//   in any byte (0 when there is none); the result is B without left columns on each side and
//   top rows at the top and at the bottom.
// Neither canvas is built: the result is copied straight from source. Returns nothing when the
// trimmed size is below one pixel in either direction (a picture only a few pixels high or
// wide). Throws std::length_error when the result would exceed Bitmap32::kMaxPixels.
std::optional<Bitmap32> RotatePicture(const Bitmap32& source, int cx, int cy, QuarterTurn turn);

// The centre the rotation commands turn a picture about: (Round(W / 2), Round(H / 2)).
int RotationCentre(int side);

}  // namespace quillane
