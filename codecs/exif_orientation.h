// The Orientation tag of a JPEG file's EXIF block, read through libexif.
#pragma once

#include <cstdint>
#include <span>

namespace quillane::codecs {

// orientation 1..8 (see imaging/orientation.h) from the payload of an APP1 segment, which
// starts "Exif\0\0" when it is an EXIF block. Anything else, a block without the tag, a tag of
// the wrong type or out of range, or a block libexif cannot make sense of gives 1: a damaged
// EXIF block must not cost the user the picture, which is complete without it.
int ExifOrientation(std::span<const std::uint8_t> app1Payload);

}  // namespace quillane::codecs
