// Which variant of a routine runs: routines that have one compiled for AVX2 (and some for
// AVX-512) use the widest this processor has, so that the program still runs on any x86-64.
// Every variant gives the same bytes; the tests narrow the choice to compare the others too.
#pragma once

namespace quillane {

enum class VectorWidth { Plain, Avx2, Avx512 };

// Whether AVX2 variants run: the processor has AVX2 and the widest allowed is at least that.
bool UseAvx2();

// Whether AVX-512 variants run: the processor has AVX-512 F, BW, VL and DQ besides AVX2, and
// they are allowed.
bool UseAvx512();

// The widest variants allowed to run; the default allows all.
void SetWidestVectors(VectorWidth widest);

// Whether AVX-512 variants may read their larger tables with gather instructions. Where the
// processor's microcode guards against gather data sampling, or the system cannot say whether
// it does, each gather takes several times longer, and a table is read an entry at a time.
bool UseAvx512Gathers();

// Allows or forbids those gathers (where the processor runs AVX-512 at all); the default allows
// them.
void SetGathersAllowed(bool allowed);

}  // namespace quillane
