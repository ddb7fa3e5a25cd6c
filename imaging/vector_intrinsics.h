// The processor's vector instructions, for the variants compiled beside the plain routines
// (vector_dispatch.h chooses among them at run time).
#pragma once

#if defined(__x86_64__) && defined(__GNUC__)
// GCC 12's AVX-512 intrinsics start some results from a deliberately undefined register, which
// its own warning then reports from inside the header.
#if defined(__clang__)
#include <immintrin.h>
#else
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"
#include <immintrin.h>
#pragma GCC diagnostic pop
#endif

// Functions for processors with AVX-512 F, BW, VL and DQ besides AVX2, as UseAvx512() asks.
#define QUILLANE_AVX512 [[gnu::target("avx2,avx512f,avx512bw,avx512vl,avx512dq")]]
#define QUILLANE_AVX512_INLINE \
  [[gnu::target("avx2,avx512f,avx512bw,avx512vl,avx512dq"), gnu::always_inline]] inline
#endif
