// The fifteen gray surface tiles of the Texture effect, built into the program.
#pragma once

#include <cstdint>
#include <span>

#include "imaging/bitmap32.h"

namespace quillane {

constexpr int kTextureTiles = 15;

// Tile n (1..15): 58 by 58 gray pixels, alpha 255. std::out_of_range for any other n.
Bitmap32 TextureTile(int n);

// Decodes an uncompressed bottom-up or top-down BMP with 24 bits per pixel, or with 8 bits and
// a palette, into a 32-bit bitmap with alpha 255. Anything else, or a file whose headers,
// palette or pixels do not fit its length, throws std::runtime_error; nothing is read outside
// bytes.
Bitmap32 DecodeBitmap(std::span<const std::uint8_t> bytes);

}  // namespace quillane
