// The gray values of the edge map one row at a time, for passes that use them pixel by pixel
// beside the picture itself and so need no edge map as a picture.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// Writes into gray[0 .. width - 1] the gray values (GrayValue) of row y of the edge map that
// picsobel makes of source, border rows and columns included. For pictures of at least 3 by 3;
// rows of a band can be asked for in any order and from any thread.
void EdgeGrayRow(const TBitmap32& source, int y, std::uint8_t* gray);

}  // namespace quillane
