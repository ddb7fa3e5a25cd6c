// Colour filter: a gray picture seen through a strong colour filter.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// Filters 1..6: red, green, blue, yellow, cyan, purple.
enum class ColorFilterKind { Red = 1, Green, Blue, Yellow, Cyan, Purple };

// Every pixel of a copy of base becomes its gray value (Round(0.3 R + 0.59 G + 0.11 B),
// extended precision, halves to even) in all three channels, then the filter's channels
// become 255: red; green; blue; red and green; green and blue; red and blue. Alpha 255.
Bitmap32 ColorFilter(const Bitmap32& base, ColorFilterKind kind);

// The channels that filter kind raises to 255, as a 0xAARRGGBB word (alpha not among them).
std::uint32_t ColorFilterRaisedChannels(ColorFilterKind kind);

}  // namespace quillane
