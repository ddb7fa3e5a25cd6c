// The painting effects (effects/paint/) one pixel and one step after another: what their
// threaded, table-driven and vector passes must equal.
#pragma once

#include <cstdint>

#include "imaging/bitmap32.h"

namespace quillane {

// Brume one pixel and one draw after another: the reference for Brume.
Bitmap32 BrumeReference(const Bitmap32& source, int scope, std::uint32_t& seed);

// ColorPencil step by step as its header writes it, with no tables, no shortcuts and one
// thread: the reference the fast version is checked against.
Bitmap32 ColorSketchReference(const Bitmap32& source, int pressure);

// Ascending sort of a[0..last]: for i from 0 to last-1, for j from last down to i+1, a[j] and
// a[i] swap when a[j] < a[i].
void SelectionSort(int* a, int last);

// The water colour effect as written out first: full copies per pass, nine values per channel
// gathered and sorted with SelectionSort, entry 4 taken. The reference for WaterColor.
Bitmap32 WaterColorReference(const Bitmap32& source, int cycles);

}  // namespace quillane
