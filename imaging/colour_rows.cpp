// Plain stores throughout: on the machines measured, streaming the results past the caches made
// these passes slower, not faster.
#include "imaging/colour_rows.h"

#include <algorithm>
#include <bit>
#include <cstring>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

#include "imaging/vector_dispatch.h"

namespace quillane {
namespace {

static_assert(std::endian::native == std::endian::little, "pixels are read as 0xAARRGGBB");

std::uint32_t Word(Pixel p) {
  return std::bit_cast<std::uint32_t>(p);
}

void PlainTintRow(const Pixel* in, int stride, const Pixel* alphaOf, Pixel* out, int n,
                  const ChannelTint& tint) {
  for (int x = 0; x < n; ++x) {
    Pixel p = Tinted(in[static_cast<std::ptrdiff_t>(stride) * x], tint);
    if (alphaOf != nullptr) p.a = alphaOf[x].a;
    out[x] = p;
  }
}

void PlainStripeRow(const Pixel* in, Pixel* out, int n, const std::uint32_t* stripe, Pixel o) {
  for (int x = 0; x < n; ++x) {
    const Pixel t = in[x];
    if (stripe[x] != 0)
      out[x] = StripeOver(o, t);
    else
      out[x] = t.a == 0 ? Pixel{255, 255, 255, 0} : t;
  }
}

#if defined(__x86_64__) && defined(__GNUC__)
struct TintVectors {
  __m256i add, sub, clear, set;
};

// Pixels 0, stride, .., 7 stride of in tinted; with alphaOf, alpha from alphaOf[0 .. 7].
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Tint8(const Pixel* in, int stride,
                                                                 const Pixel* alphaOf,
                                                                 const TintVectors& t) {
  __m256i v;
  if (stride == 1) {
    v = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in));
  } else {
    // The even pixels of 16: 0 2 8 10 | 4 6 12 14 from the shuffle, then put in order.
    const float* p = reinterpret_cast<const float*>(in);
    const __m256 even = _mm256_shuffle_ps(_mm256_loadu_ps(p), _mm256_loadu_ps(p + 8), 0x88);
    v = _mm256_permute4x64_epi64(_mm256_castps_si256(even), 0xD8);
  }
  v = _mm256_subs_epu8(_mm256_adds_epu8(v, t.add), t.sub);
  v = _mm256_or_si256(_mm256_andnot_si256(t.clear, v), t.set);
  if (alphaOf != nullptr)
    v = _mm256_or_si256(
        v, _mm256_and_si256(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(alphaOf)),
                            _mm256_set1_epi32(static_cast<int>(0xFF000000u))));
  return v;
}

[[gnu::target("avx2")]] void Avx2TintRow(const Pixel* in, int stride, const Pixel* alphaOf,
                                         Pixel* out, int n, const ChannelTint& tint) {
  const std::uint32_t clearWord = tint.clear | (alphaOf != nullptr ? 0xFF000000u : 0u);
  const TintVectors t{_mm256_set1_epi32(static_cast<int>(tint.add)),
                      _mm256_set1_epi32(static_cast<int>(tint.sub)),
                      _mm256_set1_epi32(static_cast<int>(clearWord)),
                      _mm256_set1_epi32(static_cast<int>(tint.set))};
  // The pairs of 16 pixels read with stride 2 end one pixel past the last one used.
  const int room = stride == 1 ? 8 : 9;
  int x = 0;
  for (; x + room <= n; x += 8) {
    const __m256i v = Tint8(in + stride * x, stride, alphaOf != nullptr ? alphaOf + x : nullptr, t);
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(out + x), v);
  }
  // The last pixels (runs between zone borders are often short) through copies of them.
  const int rest = n - x;
  if (rest == 0) return;
  Pixel source[16] = {}, alphas[8] = {};
  alignas(32) Pixel result[8];
  std::memcpy(source, in + stride * x,
              sizeof(Pixel) * static_cast<std::size_t>(stride * (rest - 1) + 1));
  if (alphaOf != nullptr)
    std::memcpy(alphas, alphaOf + x, sizeof(Pixel) * static_cast<std::size_t>(rest));
  _mm256_store_si256(reinterpret_cast<__m256i*>(result),
                     Tint8(source, stride, alphaOf != nullptr ? alphas : nullptr, t));
  std::memcpy(out + x, result, sizeof(Pixel) * static_cast<std::size_t>(rest));
}

// 16-bit lanes of B, G, R, A: (t keep + colour) div 255, as (v * 0x8081) >> 23, which is exact
// up to 255 * 255.
[[gnu::target("avx2"), gnu::always_inline]] inline __m256i Mix(__m256i t, __m256i keep,
                                                               __m256i colour) {
  const __m256i v = _mm256_add_epi16(_mm256_mullo_epi16(t, keep), colour);
  return _mm256_srli_epi16(_mm256_mulhi_epu16(v, _mm256_set1_epi16(static_cast<short>(0x8081))), 7);
}

[[gnu::target("avx2")]] void Avx2StripeRow(const Pixel* in, Pixel* out, int n,
                                           const std::uint32_t* stripe, Pixel o) {
  // Per 16-bit lane of a pixel's B, G, R, A: keep 255 - a and colour c a; alpha comes out 255.
  const int a = o.a;
  const __m256i keep = _mm256_set1_epi64x(
      static_cast<long long>(0x0000'0001'0001'0001ull * static_cast<unsigned>(255 - a)));
  const __m256i colour = _mm256_set1_epi64x(static_cast<long long>(
      static_cast<std::uint64_t>(255 * 255) << 48 | static_cast<std::uint64_t>(a * o.r) << 32 |
      static_cast<std::uint64_t>(a * o.g) << 16 | static_cast<std::uint64_t>(a * o.b)));
  const __m256i alpha = _mm256_set1_epi32(static_cast<int>(0xFF000000u));
  const __m256i white = _mm256_set1_epi32(0x00FFFFFF);
  const __m256i zero = _mm256_setzero_si256();
  int x = 0;
  for (; x + 8 <= n; x += 8) {
    const __m256i t = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in + x));
    const __m256i m = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(stripe + x));
    const __m256i a8 = _mm256_and_si256(t, alpha);
    const __m256i opaque = _mm256_cmpeq_epi32(a8, alpha);
    const __m256i gap = _mm256_blendv_epi8(t, white, _mm256_cmpeq_epi32(a8, zero));
    const __m256i mixed = _mm256_packus_epi16(Mix(_mm256_unpacklo_epi8(t, zero), keep, colour),
                                              Mix(_mm256_unpackhi_epi8(t, zero), keep, colour));
    __m256i v = _mm256_blendv_epi8(gap, mixed, m);
    // Stripes over pixels that are not opaque take the full quotient, one by one.
    auto odd = static_cast<std::uint32_t>(
        _mm256_movemask_ps(_mm256_castsi256_ps(_mm256_andnot_si256(opaque, m))));
    if (odd != 0) {
      alignas(32) Pixel pixels[8];
      _mm256_store_si256(reinterpret_cast<__m256i*>(pixels), v);
      for (; odd != 0; odd &= odd - 1) {
        const int i = std::countr_zero(odd);
        pixels[i] = StripeOver(o, in[x + i]);
      }
      v = _mm256_load_si256(reinterpret_cast<const __m256i*>(pixels));
    }
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(out + x), v);
  }
  PlainStripeRow(in + x, out + x, n - x, stripe + x, o);
}
#endif

}  // namespace

Pixel Tinted(Pixel p, const ChannelTint& tint) {
  const std::uint32_t in = Word(p);
  std::uint32_t word = 0;
  for (int shift = 0; shift < 32; shift += 8) {
    const auto byte = [shift](std::uint32_t w) { return static_cast<int>(w >> shift & 0xFF); };
    const int raised = std::min(byte(in) + byte(tint.add), 255);
    word |= static_cast<std::uint32_t>(std::max(raised - byte(tint.sub), 0)) << shift;
  }
  return std::bit_cast<Pixel>((word & ~tint.clear) | tint.set);
}

Pixel StripeOver(Pixel o, Pixel t) {
  if (t.a == 255) {
    const auto blend = [&](int tc, int oc) {
      return static_cast<std::uint8_t>(((255 - o.a) * tc + o.a * oc) / 255);
    };
    return Pixel{blend(t.b, o.b), blend(t.g, o.g), blend(t.r, o.r), 255};
  }
  if (t.a == 0 || o.a == 255) return o;
  const std::uint32_t at = t.a, ao = o.a;
  const std::uint32_t d = 255 * (ao + at) - ao * at;
  const std::uint32_t wt = at * (255 - ao);
  const std::uint32_t wo = 255 * ao;
  return Pixel{static_cast<std::uint8_t>((wt * t.b + wo * o.b) / d),
               static_cast<std::uint8_t>((wt * t.g + wo * o.g) / d),
               static_cast<std::uint8_t>((wt * t.r + wo * o.r) / d),
               static_cast<std::uint8_t>(d / 255)};
}

void TintRow(const Pixel* in, int stride, const Pixel* alphaOf, Pixel* out, int n,
             const ChannelTint& tint) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) {
    Avx2TintRow(in, stride, alphaOf, out, n, tint);
    return;
  }
#endif
  PlainTintRow(in, stride, alphaOf, out, n, tint);
}

void StripeRow(const Pixel* in, Pixel* out, int n, const std::uint32_t* stripe, Pixel o) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) {
    Avx2StripeRow(in, out, n, stripe, o);
    return;
  }
#endif
  PlainStripeRow(in, out, n, stripe, o);
}

}  // namespace quillane
