// The picture shown when the program starts, built into the program.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "imaging/bitmap32.h"

namespace quillane {

// The built-in start-up picture: 521 by 346 pixels, alpha 255.
Bitmap32 StartupPicture();

// Decodes an uncompressed 24-bit BMP (bottom-up, or top-down with a negative height) into a
// 32-bit bitmap with alpha 255. Anything else, or a file whose headers do not fit its length,
// throws std::runtime_error; nothing is read outside bytes.
Bitmap32 DecodeBitmap24(std::span<const std::uint8_t> bytes);

}  // namespace quillane
