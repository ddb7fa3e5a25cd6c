// The eight ways a camera records how its picture stands (the EXIF Orientation values), and
// turning stored pixels upright by them. Unlike the rotation commands (rotate.h), which turn
// about a rounded centre inside a padded canvas, these are exact: every pixel is kept, and a
// W by H picture becomes H by W or stays W by H.
#pragma once

#include "imaging/bitmap32.h"

namespace quillane {

// 1 upright; 2 mirrored left to right; 3 turned half round; 4 mirrored top to bottom;
// 5 mirrored about the main diagonal (transposed); 6 to be turned a quarter clockwise;
// 7 mirrored about the other diagonal; 8 to be turned a quarter anticlockwise.
// Any other value counts as 1.
inline bool OrientationSwapsSides(int orientation) {
  return orientation >= 5 && orientation <= 8;
}

// The picture as it is meant to be seen. Orientations 1 to 4 work in place; 5 to 8 need a
// second picture of the same size. Throws std::bad_alloc when memory runs out.
Bitmap32 UprightPicture(Bitmap32 stored, int orientation);

}  // namespace quillane
