// Which variant of a routine runs: routines that have one compiled for AVX2 use it when this
// processor has the instructions, so that the program still runs on any x86-64. Both variants
// give the same bytes; the tests turn the faster one off to compare the other as well.
#pragma once

namespace quillane {

// Whether AVX2 variants run: the processor has AVX2 and they are allowed (the default).
bool UseAvx2();

void SetAvx2Allowed(bool allowed);

}  // namespace quillane
