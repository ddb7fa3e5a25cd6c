#include "imaging/ink_rows.h"

#include <cstring>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

// Pixels seen as 32-bit words, blue in the lowest byte.
using Word [[gnu::may_alias]] = std::uint32_t;

// A cell widened to 32 bits is all ones for paper and 0 for ink; alpha is set either way, and
// the colour shows only through ink.
[[gnu::always_inline]] inline void PixelLoop(const std::uint8_t* __restrict cells, int n,
                                             Word* __restrict out, const Word* __restrict colours) {
  if (colours == nullptr) {
    for (int x = 0; x < n; ++x)
      out[x] = static_cast<std::uint32_t>(static_cast<std::int8_t>(cells[x])) | 0xFF000000u;
  } else {
    for (int x = 0; x < n; ++x)
      out[x] =
          static_cast<std::uint32_t>(static_cast<std::int8_t>(cells[x])) | 0xFF000000u | colours[x];
  }
}

Word* Words(Pixel* p) {
  return reinterpret_cast<Word*>(p);
}
const Word* Words(const Pixel* p) {
  return reinterpret_cast<const Word*>(p);
}

#if defined(__x86_64__) && defined(__GNUC__)
// Eight pixels at a time, stored past the caches: a drawing is far larger than they are, and
// streaming stores spare reading each line of it before writing it.
[[gnu::target("avx2")]] void Avx2Pixels(const std::uint8_t* cells, int n, Pixel* out,
                                        const Pixel* colours) {
  int x = 0;
  for (; x < n && reinterpret_cast<std::uintptr_t>(out + x) % 32 != 0; ++x)
    PixelLoop(cells + x, 1, Words(out + x), colours == nullptr ? nullptr : Words(colours + x));
  const __m256i alpha = _mm256_set1_epi32(static_cast<int>(0xFF000000u));
  for (; x + 8 <= n; x += 8) {
    std::uint64_t eight;
    std::memcpy(&eight, cells + x, 8);
    __m256i v = _mm256_or_si256(
        _mm256_cvtepi8_epi32(_mm_cvtsi64_si128(static_cast<long long>(eight))), alpha);
    if (colours != nullptr)
      v = _mm256_or_si256(v, _mm256_loadu_si256(reinterpret_cast<const __m256i*>(colours + x)));
    _mm256_stream_si256(reinterpret_cast<__m256i*>(out + x), v);
  }
  PixelLoop(cells + x, n - x, Words(out + x), colours == nullptr ? nullptr : Words(colours + x));
}
#endif

}  // namespace

void InkPixels(const std::uint8_t* cells, int n, Pixel* out, const Pixel* colours) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2Pixels(cells, n, out, colours);
#endif
  PixelLoop(cells, n, Words(out), colours == nullptr ? nullptr : Words(colours));
}

void EndStreamedRows() {
#if defined(__x86_64__)
  _mm_sfence();
#endif
}

}  // namespace quillane
