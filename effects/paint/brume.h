// Brume: every pixel takes the colour of a randomly chosen pixel near it, as if seen through
// mist.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// The program's random generator, a 32-bit linear congruential one: each step makes
// seed = seed * 134775813 + 1 (mod 2^32); a draw with range N (N >= 1) steps once and gives
// the upper 32 bits of N * seed, which lie in 0..N-1.
std::uint32_t RandomDraw(std::uint32_t& seed, std::uint32_t range);

// The seed after steps more steps; as one step is an affine map, any number of them is one
// affine map too, found by squaring.
std::uint32_t RandomJump(std::uint32_t seed, std::uint64_t steps);

// For each row y from 1 to H-1 and in it each column x from 1 to W-1, in that order, two
// draws with range scope + 3:
//   ry = first + y - scope, rx = second + x - scope, each limited to the picture;
// pixel (x, y) takes blue, green and red of source pixel (rx, ry) and alpha 255. Row 0 and
// column 0 keep the source. seed is continued by exactly 2 (W-1) (H-1) steps, so the result
// also depends on every run before; rows run on several threads with the same bytes.
Bitmap32 Brume(const Bitmap32& source, int scope, std::uint32_t& seed);

// The same into out, which must already have source's size.
void BrumeInto(const Bitmap32& source, int scope, std::uint32_t& seed, Bitmap32& out);

}  // namespace quillane
