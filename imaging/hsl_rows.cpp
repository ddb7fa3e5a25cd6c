// Whole rows through the colour model: RGB to HSL, a change of H, S and L, and back, in one
// walk over each stretch of a row with nothing between source and result but small arrays.
//
// RGB to HSL in whole numbers: with mx, mn the largest and smallest channel, d = mx - mn and
// sum = mx + mn,
//   L = Round(100 sum / 510), never an exact half, so floor((20 sum + 51) / 102);
//   S = Round(100 d / den) with den = sum below 255 and 510 - sum from it;
//   H = the sector's base (0, 120, 240) plus or minus Round(60 a / d), a the distance of the
//       other two channels, a negative hue taken a turn round.
// Away from an exact half of those quotients the floating-point formulas land on the same
// whole number (their error is below 1e-12, the distance to a half at least 1 / 510). At an
// exact half their rounding errors decide, so such colours (one in twenty-five of a
// photograph) go through the floating-point formulas themselves. The AVX2 and AVX-512 variants
// take the quotients in single precision: every numerator is below 2^16 and every divisor at
// most 510, so the quotient's floor is exact.
#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

#include "imaging/hsl_halves.h"
#include "imaging/numeric.h"
#include "imaging/tone.h"
#include "imaging/vector_dispatch.h"
#include "imaging/vector_intrinsics.h"

namespace quillane {
namespace {

// How a pass finds the lightness it converts back with, from the L of each colour.
enum class LightnessFrom {
  Own,       // L itself
  Shifted,   // L + shift[x], limited to 0..100
  Levelled,  // byLevel[level[x] * 101 + L]
};

struct LightnessSource {
  const std::int16_t* shift = nullptr;
  const std::uint8_t* level = nullptr;
  const std::uint8_t* byLevel = nullptr;
};

template <LightnessFrom kFrom>
inline int LightnessAt(const LightnessSource& source, int x, int l) {
  if constexpr (kFrom == LightnessFrom::Shifted) return std::clamp(l + source.shift[x], 0, 100);
  if constexpr (kFrom == LightnessFrom::Levelled) return source.byLevel[source.level[x] * 101 + l];
  return l;
}

// The pixel of a colour's changed hue and saturation (0x00RRGGBB, from hueSaturation) at the
// changed lightness row.
inline Pixel ColourPixel(std::uint32_t c, const std::uint8_t* light) {
  return Pixel{light[c & 0xFF], light[(c >> 8) & 0xFF], light[c >> 16], 255};
}

template <LightnessFrom kFrom>
void PlainRow(const std::uint32_t* hueSaturation, const std::uint8_t* lightRows, const Pixel* in,
              Pixel* out, int x0, int x1, const LightnessSource& source) {
  for (int x = x0; x < x1; ++x) {
    const Pixel p = in[x];
    const Hsl c = RgbToHsl(p.r, p.g, p.b);
    const int l = LightnessAt<kFrom>(source, x, c.l);
    out[x] = ColourPixel(hueSaturation[c.h * 101 + c.s], lightRows + l * 256);
  }
}

void PlainHslRow(const Pixel* in, Hsl* out, int n) {
  for (int i = 0; i < n; ++i) out[i] = RgbToHsl(in[i].r, in[i].g, in[i].b);
}

#if defined(__x86_64__) && defined(__GNUC__)
#define QUILLANE_AVX2 [[gnu::target("avx2")]]
#define QUILLANE_AVX2_INLINE [[gnu::target("avx2"), gnu::always_inline]] inline

// floor(num / den) of whole numbers below 2^24, den > 0.
QUILLANE_AVX2_INLINE __m256i Quotient(__m256i num, __m256i den) {
  return _mm256_cvttps_epi32(_mm256_div_ps(_mm256_cvtepi32_ps(num), _mm256_cvtepi32_ps(den)));
}

// H, S and L of 8 pixels in 32-bit lanes; H and S hold for the pixels not marked in halves.
struct HslLanes {
  __m256i h, s, l;
  unsigned halves;
};

QUILLANE_AVX2_INLINE HslLanes Avx2Hsl8(const Pixel* in) {
  const __m256i p = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(in));
  const __m256i byte = _mm256_set1_epi32(0xFF);
  const __m256i b = _mm256_and_si256(p, byte);
  const __m256i g = _mm256_and_si256(_mm256_srli_epi32(p, 8), byte);
  const __m256i r = _mm256_and_si256(_mm256_srli_epi32(p, 16), byte);
  const __m256i mx = _mm256_max_epi32(r, _mm256_max_epi32(g, b));
  const __m256i mn = _mm256_min_epi32(r, _mm256_min_epi32(g, b));
  const __m256i one = _mm256_set1_epi32(1);
  const __m256i d = _mm256_sub_epi32(mx, mn);
  const __m256i sum = _mm256_add_epi32(mx, mn);
  HslLanes out;
  // (20 sum + 51) * 41121 >> 22 is floor((20 sum + 51) / 102) for sums up to 510.
  out.l = _mm256_srli_epi32(
      _mm256_mullo_epi32(
          _mm256_add_epi32(_mm256_mullo_epi32(sum, _mm256_set1_epi32(20)), _mm256_set1_epi32(51)),
          _mm256_set1_epi32(41121)),
      22);

  // Saturation: floor((200 d + den) / (2 den)) rounds half up; a gray (d = 0) gets 0, with den
  // kept from 0 so that black and white divide by something.
  const __m256i den =
      _mm256_max_epi32(_mm256_min_epi32(sum, _mm256_sub_epi32(_mm256_set1_epi32(510), sum)), one);
  const __m256i twiceDen = _mm256_add_epi32(den, den);
  const __m256i numS = _mm256_add_epi32(_mm256_mullo_epi32(d, _mm256_set1_epi32(200)), den);
  out.s = Quotient(numS, twiceDen);
  const __m256i halfS = _mm256_cmpeq_epi32(_mm256_mullo_epi32(out.s, twiceDen), numS);

  // Hue: the largest channel picks the sector, red before green before blue.
  const __m256i redMax = _mm256_cmpeq_epi32(r, mx);
  const __m256i greenMax = _mm256_andnot_si256(redMax, _mm256_cmpeq_epi32(g, mx));
  const __m256i signedDistance = _mm256_blendv_epi8(
      _mm256_blendv_epi8(_mm256_sub_epi32(r, g), _mm256_sub_epi32(b, r), greenMax),
      _mm256_sub_epi32(g, b), redMax);
  const __m256i base = _mm256_blendv_epi8(
      _mm256_blendv_epi8(_mm256_set1_epi32(240), _mm256_set1_epi32(120), greenMax),
      _mm256_setzero_si256(), redMax);
  const __m256i span = _mm256_max_epi32(d, one);
  const __m256i twiceSpan = _mm256_add_epi32(span, span);
  const __m256i numH = _mm256_add_epi32(
      _mm256_mullo_epi32(_mm256_abs_epi32(signedDistance), _mm256_set1_epi32(120)), span);
  const __m256i steps = Quotient(numH, twiceSpan);
  const __m256i halfH = _mm256_cmpeq_epi32(_mm256_mullo_epi32(steps, twiceSpan), numH);
  const __m256i h = _mm256_add_epi32(base, _mm256_sign_epi32(steps, signedDistance));
  out.h = _mm256_add_epi32(
      h, _mm256_and_si256(_mm256_cmpgt_epi32(_mm256_setzero_si256(), h), _mm256_set1_epi32(360)));

  out.halves =
      static_cast<unsigned>(_mm256_movemask_ps(_mm256_castsi256_ps(_mm256_or_si256(halfS, halfH))));
  return out;
}

QUILLANE_AVX2 void Avx2HslRow(const Pixel* in, Hsl* out, int n) {
  int x = 0;
  for (; x + 8 <= n; x += 8) {
    const HslLanes c = Avx2Hsl8(in + x);
    alignas(32) std::int32_t hs[8], ss[8], ls[8];
    _mm256_store_si256(reinterpret_cast<__m256i*>(hs), c.h);
    _mm256_store_si256(reinterpret_cast<__m256i*>(ss), c.s);
    _mm256_store_si256(reinterpret_cast<__m256i*>(ls), c.l);
    for (int i = 0; i < 8; ++i) out[x + i] = Hsl{hs[i], ss[i], ls[i]};
    for (unsigned halves = c.halves; halves != 0; halves &= halves - 1) {
      const int i = x + __builtin_ctz(halves);
      out[i] = RgbToHsl(in[i].r, in[i].g, in[i].b);
    }
  }
  PlainHslRow(in + x, out + x, n - x);
}

// Round(v * factor) of 4 fractions 0 <= v <= 1, with factor 100 or 360, exactly as in extended
// precision (where the product is exact): v is split into halves of 26 bits whose products
// with factor are exact, so the sign of v * factor - (k + 1/2) comes out right.
QUILLANE_AVX2_INLINE __m256d RoundProduct(__m256d v, double factor) {
  const __m256d f = _mm256_set1_pd(factor);
  const __m256d split = _mm256_mul_pd(v, _mm256_set1_pd(134217729.0));  // 2^27 + 1
  const __m256d high = _mm256_sub_pd(split, _mm256_sub_pd(split, v));
  const __m256d low = _mm256_sub_pd(v, high);
  const __m256d k = _mm256_floor_pd(_mm256_mul_pd(v, f));
  const __m256d beyondHalf =
      _mm256_add_pd(_mm256_sub_pd(_mm256_mul_pd(high, f), _mm256_add_pd(k, _mm256_set1_pd(0.5))),
                    _mm256_mul_pd(low, f));
  const __m256d one = _mm256_set1_pd(1);
  const __m256d odd = _mm256_cmp_pd(
      _mm256_sub_pd(k, _mm256_mul_pd(_mm256_floor_pd(_mm256_mul_pd(k, _mm256_set1_pd(0.5))),
                                     _mm256_set1_pd(2))),
      one, _CMP_EQ_OQ);
  const __m256d zero = _mm256_setzero_pd();
  const __m256d up = _mm256_or_pd(_mm256_cmp_pd(beyondHalf, zero, _CMP_GT_OQ),
                                  _mm256_and_pd(_mm256_cmp_pd(beyondHalf, zero, _CMP_EQ_OQ), odd));
  return _mm256_add_pd(k, _mm256_and_pd(up, one));
}

// The channel at shift of 4 colours as the fractions v / 255.
QUILLANE_AVX2_INLINE __m256d Fractions(const std::uint32_t* colours, int shift) {
  const auto& f = hsl_halves::kFractions;
  return _mm256_setr_pd(f[(colours[0] >> shift) & 0xFF], f[(colours[1] >> shift) & 0xFF],
                        f[(colours[2] >> shift) & 0xFF], f[(colours[3] >> shift) & 0xFF]);
}

// H (returned) and S of 4 colours that are not gray (0xAARRGGBB), straight from the
// floating-point formulas: the colours at an exact half.
QUILLANE_AVX2_INLINE __m128i Avx2FloatingHsl(const std::uint32_t* colours, __m128i& saturation) {
  const __m256d b = Fractions(colours, 0);
  const __m256d g = Fractions(colours, 8);
  const __m256d r = Fractions(colours, 16);
  const __m256d mx = _mm256_max_pd(r, _mm256_max_pd(g, b));
  const __m256d mn = _mm256_min_pd(r, _mm256_min_pd(g, b));
  const __m256d d = _mm256_sub_pd(mx, mn);
  const __m256d sum = _mm256_add_pd(mx, mn);
  const __m256d lowLight =
      _mm256_cmp_pd(_mm256_div_pd(sum, _mm256_set1_pd(2)), _mm256_set1_pd(0.5), _CMP_LT_OQ);
  const __m256d s = _mm256_div_pd(
      d, _mm256_blendv_pd(_mm256_sub_pd(_mm256_sub_pd(_mm256_set1_pd(2), mx), mn), sum, lowLight));
  const __m256d redMax = _mm256_cmp_pd(r, mx, _CMP_EQ_OQ);
  const __m256d greenMax = _mm256_andnot_pd(redMax, _mm256_cmp_pd(g, mx, _CMP_EQ_OQ));
  const __m256d num =
      _mm256_blendv_pd(_mm256_blendv_pd(_mm256_sub_pd(r, g), _mm256_sub_pd(b, r), greenMax),
                       _mm256_sub_pd(g, b), redMax);
  const __m256d sector =
      _mm256_blendv_pd(_mm256_blendv_pd(_mm256_set1_pd(4), _mm256_set1_pd(2), greenMax),
                       _mm256_setzero_pd(), redMax);
  __m256d h = _mm256_div_pd(_mm256_add_pd(sector, _mm256_div_pd(num, d)), _mm256_set1_pd(6));
  h = _mm256_add_pd(
      h, _mm256_and_pd(_mm256_cmp_pd(h, _mm256_setzero_pd(), _CMP_LT_OQ), _mm256_set1_pd(1)));
  __m128i hue = _mm256_cvtpd_epi32(RoundProduct(h, 360));
  hue = _mm_andnot_si128(_mm_cmpeq_epi32(hue, _mm_set1_epi32(360)), hue);
  saturation = _mm256_cvtpd_epi32(RoundProduct(s, 100));
  return hue;
}

// Puts the floating-point H * 101 + S of the listed pixels into colour, four at a time.
QUILLANE_AVX2_INLINE void PutHalves(const Pixel* in, std::int16_t* halves, int count,
                                    std::uint16_t* colour) {
  if (count == 0) return;
  for (int k = count; k % 4 != 0; ++k) halves[k] = halves[count - 1];
  for (int k = 0; k < count; k += 4) {
    std::uint32_t words[4];
    for (int j = 0; j < 4; ++j) std::memcpy(&words[j], in + halves[k + j], 4);
    __m128i s;
    const __m128i h = Avx2FloatingHsl(words, s);
    alignas(16) std::int32_t found[4];
    _mm_store_si128(reinterpret_cast<__m128i*>(found),
                    _mm_add_epi32(_mm_mullo_epi32(h, _mm_set1_epi32(101)), s));
    for (int j = 0; j < 4; ++j) colour[halves[k + j]] = static_cast<std::uint16_t>(found[j]);
  }
}

// For each 8-bit mask, the positions of its set bits.
constexpr auto kSetBits = [] {
  std::array<std::array<std::uint8_t, 8>, 256> t{};
  for (int m = 0; m < 256; ++m)
    for (int bit = 0, n = 0; bit < 8; ++bit)
      if ((m >> bit) & 1)
        t[static_cast<std::size_t>(m)][static_cast<std::size_t>(n++)] =
            static_cast<std::uint8_t>(bit);
  return t;
}();

// Where the lightness factor (L - 50) / 50, held in double, lies below its true value: there a
// half of the blend rounds down, elsewhere up, except where the factor is exact (L = 25, 75)
// and a half goes to the even neighbour. Words of 16 bits: L in word L / 16 at bit L % 16.
const std::array<std::uint16_t, 8>& LightnessBelow() {
  static const auto words = [] {
    std::array<std::uint16_t, 8> w{};
    for (int l = 0; l <= 100; ++l)
      // The product is exact in extended precision.
      if (static_cast<Extended>((l - 50) / 50.0) * 50 < l - 50)
        w[static_cast<std::size_t>(l / 16)] |= static_cast<std::uint16_t>(1u << (l % 16));
    return w;
  }();
  return words;
}

// All ones in the 16-bit lanes whose value v (0..127) has its bit set in words.
QUILLANE_AVX2_INLINE __m256i BitSet(const std::array<std::uint16_t, 8>& words, __m256i v) {
  const __m256i low = _mm256_and_si256(v, _mm256_set1_epi16(15));
  const __m256i lowBits = _mm256_setr_epi8(1, 2, 4, 8, 16, 32, 64, -128, 0, 0, 0, 0, 0, 0, 0, 0, 1,
                                           2, 4, 8, 16, 32, 64, -128, 0, 0, 0, 0, 0, 0, 0, 0);
  const __m256i highBits = _mm256_setr_epi8(0, 0, 0, 0, 0, 0, 0, 0, 1, 2, 4, 8, 16, 32, 64, -128, 0,
                                            0, 0, 0, 0, 0, 0, 0, 1, 2, 4, 8, 16, 32, 64, -128);
  const __m256i both = _mm256_mullo_epi16(low, _mm256_set1_epi16(0x0101));
  const __m256i bit = _mm256_or_si256(
      _mm256_and_si256(_mm256_shuffle_epi8(lowBits, both), _mm256_set1_epi16(0x00FF)),
      _mm256_and_si256(_mm256_shuffle_epi8(highBits, both), _mm256_set1_epi16(-256)));
  const __m256i wordIndex =
      _mm256_add_epi16(_mm256_mullo_epi16(_mm256_srli_epi16(v, 4), _mm256_set1_epi16(0x0202)),
                       _mm256_set1_epi16(0x0100));
  const __m256i table =
      _mm256_broadcastsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(words.data())));
  return _mm256_cmpeq_epi16(_mm256_and_si256(_mm256_shuffle_epi8(table, wordIndex), bit), bit);
}

// The lightness blend of 16-bit lanes x: Round(x + (255 - x) t) above L = 50 and Round(x + x t)
// below, t = (L - 50) / 50, is (x m + c) / 50 in whole numbers with m = 100 - L and
// c = 255 (L - 50) above, m = L and c = 0 below. It is rounded by adding 25 before dividing,
// or 24 where a half rounds down; at L = 25 and 75 the value is y / 2 with y = x + c / 25, and
// 24 plus bit 1 of y takes a half to even.
struct LightTerms {
  __m256i m, c, exactOffset, exactBit;
};

QUILLANE_AVX2_INLINE LightTerms LightTermsOf(__m256i l) {
  LightTerms t;
  const __m256i bright = _mm256_cmpgt_epi16(l, _mm256_set1_epi16(50));
  t.m = _mm256_blendv_epi8(l, _mm256_sub_epi16(_mm256_set1_epi16(100), l), bright);
  const __m256i exact = _mm256_or_si256(_mm256_cmpeq_epi16(l, _mm256_set1_epi16(25)),
                                        _mm256_cmpeq_epi16(l, _mm256_set1_epi16(75)));
  const __m256i down = _mm256_or_si256(BitSet(LightnessBelow(), l), exact);
  t.c = _mm256_add_epi16(
      _mm256_and_si256(bright, _mm256_mullo_epi16(_mm256_sub_epi16(l, _mm256_set1_epi16(50)),
                                                  _mm256_set1_epi16(255))),
      _mm256_add_epi16(_mm256_set1_epi16(25), down));
  t.exactOffset = _mm256_and_si256(_mm256_and_si256(exact, bright), _mm256_set1_epi16(255));
  t.exactBit = _mm256_and_si256(exact, _mm256_set1_epi16(1));
  return t;
}

QUILLANE_AVX2_INLINE __m256i LightBlend(__m256i x, const LightTerms& t) {
  const __m256i evenHalf =
      _mm256_and_si256(_mm256_srli_epi16(_mm256_add_epi16(x, t.exactOffset), 1), t.exactBit);
  const __m256i n = _mm256_add_epi16(_mm256_add_epi16(_mm256_mullo_epi16(x, t.m), t.c), evenHalf);
  // floor(n / 50) for n up to 12775.
  return _mm256_srli_epi16(_mm256_mulhi_epu16(n, _mm256_set1_epi16(-23592)), 5);  // 41944
}

// 16 pixels from their blended hue and saturation (0x00RRGGBB, pixels 0..7 in first and 8..15
// in second) and lightness (16-bit lanes): two registers of pixels 0xFFRRGGBB.
QUILLANE_AVX2_INLINE void Avx2Lighten16(__m256i first, __m256i second, __m256i l, __m256i& out0,
                                        __m256i& out1) {
  // Packing keeps 128-bit halves apart: the channels come out as pixels 0-3, 8-11, 4-7, 12-15,
  // so the lightness is put in that order too, and unpacking at the end restores it.
  const __m256i byte = _mm256_set1_epi32(0xFF);
  const __m256i blue =
      _mm256_packus_epi32(_mm256_and_si256(first, byte), _mm256_and_si256(second, byte));
  const __m256i green = _mm256_packus_epi32(_mm256_and_si256(_mm256_srli_epi32(first, 8), byte),
                                            _mm256_and_si256(_mm256_srli_epi32(second, 8), byte));
  const __m256i red =
      _mm256_packus_epi32(_mm256_srli_epi32(first, 16), _mm256_srli_epi32(second, 16));
  const LightTerms t = LightTermsOf(_mm256_permute4x64_epi64(l, 0xD8));
  const __m256i blueGreen =
      _mm256_or_si256(LightBlend(blue, t), _mm256_slli_epi16(LightBlend(green, t), 8));
  const __m256i redAlpha = _mm256_or_si256(LightBlend(red, t), _mm256_set1_epi16(-256));
  out0 = _mm256_unpacklo_epi16(blueGreen, redAlpha);
  out1 = _mm256_unpackhi_epi16(blueGreen, redAlpha);
}

// 8 values of 32-bit lanes as 16-bit numbers.
QUILLANE_AVX2_INLINE void Store16(std::uint16_t* to, __m256i v) {
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to),
                   _mm_packus_epi32(_mm256_castsi256_si128(v), _mm256_extracti128_si256(v, 1)));
}

QUILLANE_AVX2_INLINE __m256i Load256(const void* p) {
  return _mm256_loadu_si256(static_cast<const __m256i*>(p));
}

// Pixels per chunk: the chunk's buffers take about 14 KB, which stays in the first-level cache,
// and each chunk's fixed costs (its tail, the halves' last group) are spread over enough pixels.
constexpr int kChunk = 1024;

// The buffers of a chunk. Each has room for a last group that reaches past the chunk's end.
struct ChunkRows {
  alignas(64) std::uint16_t colour[kChunk + 32];  // H * 101 + S
  alignas(64) std::uint16_t lightness[kChunk + 32];
  alignas(64) std::uint32_t coloured[kChunk + 32];
  alignas(64) std::uint32_t pixels[kChunk + 32];
  std::int16_t halves[kChunk + 16];
};

// Lists the pixels marked in the 8-bit mask halves, from pixel i on, without a branch per pixel.
QUILLANE_AVX2_INLINE void ListHalves(ChunkRows& rows, int& count, unsigned halves, int i) {
  _mm_storeu_si128(reinterpret_cast<__m128i*>(rows.halves + count),
                   _mm_add_epi16(_mm_cvtepu8_epi16(_mm_loadl_epi64(
                                     reinterpret_cast<const __m128i*>(kSetBits[halves].data()))),
                                 _mm_set1_epi16(static_cast<std::int16_t>(i))));
  count += __builtin_popcount(halves);
}

// H, S and the lightness from its source of the 8 pixels from i of the chunk at x0.
template <LightnessFrom kFrom>
QUILLANE_AVX2_INLINE void Avx2Colours8(const Pixel* in, int x0, int i,
                                       const LightnessSource& source, ChunkRows& rows,
                                       int& halfCount) {
  const HslLanes c = Avx2Hsl8(in + x0 + i);
  __m256i l = c.l;
  if constexpr (kFrom == LightnessFrom::Shifted) {
    const __m256i shift = _mm256_cvtepi16_epi32(
        _mm_loadu_si128(reinterpret_cast<const __m128i*>(source.shift + x0 + i)));
    l = _mm256_min_epi32(_mm256_max_epi32(_mm256_add_epi32(l, shift), _mm256_setzero_si256()),
                         _mm256_set1_epi32(100));
  }
  if constexpr (kFrom == LightnessFrom::Levelled) {
    // Four bytes from each entry (the table is padded for it), the first of them kept.
    const __m256i level = _mm256_cvtepu8_epi32(
        _mm_loadl_epi64(reinterpret_cast<const __m128i*>(source.level + x0 + i)));
    const __m256i at = _mm256_add_epi32(_mm256_mullo_epi32(level, _mm256_set1_epi32(101)), l);
    l = _mm256_and_si256(
        _mm256_i32gather_epi32(reinterpret_cast<const int*>(source.byLevel), at, 1),
        _mm256_set1_epi32(0xFF));
  }
  Store16(rows.colour + i, _mm256_add_epi32(_mm256_mullo_epi32(c.h, _mm256_set1_epi32(101)), c.s));
  Store16(rows.lightness + i, l);
  ListHalves(rows, halfCount, c.halves, i);
}

// After the groups of 8 or 32 up to pixel i: the pixels left and the halves; then, unless the
// blend gathers them itself, the changed hue and saturation from the table. Past the end the
// last group finds zeros.
template <LightnessFrom kFrom, bool kLookUp = true>
QUILLANE_AVX2_INLINE void SettleChunk(const std::uint32_t* hueSaturation, const Pixel* in, int x0,
                                      int i, int n, int halfCount, const LightnessSource& source,
                                      ChunkRows& rows) {
  PutHalves(in + x0, rows.halves, halfCount, rows.colour);
  for (; i < n; ++i) {
    const Pixel p = in[x0 + i];
    const Hsl c = RgbToHsl(p.r, p.g, p.b);
    rows.colour[i] = static_cast<std::uint16_t>(c.h * 101 + c.s);
    rows.lightness[i] = static_cast<std::uint16_t>(LightnessAt<kFrom>(source, x0 + i, c.l));
  }
  if constexpr (kLookUp)
    for (i = 0; i < n; ++i) rows.coloured[i] = hueSaturation[rows.colour[i]];
  for (i = n; i < n + 32; ++i) {
    rows.colour[i] = 0;
    rows.coloured[i] = 0;
    rows.lightness[i] = 0;
  }
}

// The result goes past the caches: streaming stores spare reading each line of it before
// writing it.
QUILLANE_AVX2_INLINE void StreamOut(const std::uint32_t* pixels, int n, Pixel* out) {
  auto* dst = reinterpret_cast<std::uint8_t*>(out);
  int i = 0;
  for (; i < n && reinterpret_cast<std::uintptr_t>(dst + 4 * i) % 32 != 0; ++i)
    std::memcpy(dst + 4 * i, pixels + i, 4);
  for (; i + 8 <= n; i += 8)
    _mm256_stream_si256(reinterpret_cast<__m256i*>(dst + 4 * i), Load256(pixels + i));
  for (; i < n; ++i) std::memcpy(dst + 4 * i, pixels + i, 4);
}

// A chunk of a row at a time: H, S and L of every pixel (the halves put right) and the
// lightness from its source; then the changed hue and saturation from the table, and the
// lightness blend 16 pixels per step.
template <LightnessFrom kFrom>
QUILLANE_AVX2 void Avx2Row(const HslChange& change, const std::uint32_t* hueSaturation,
                           const Pixel* in, Pixel* out, int width, const LightnessSource& source) {
  ChunkRows rows;
  const __m256i moveL = _mm256_set1_epi16(static_cast<std::int16_t>(change.lightnessShift));
  for (int x0 = 0; x0 < width; x0 += kChunk) {
    const int n = std::min(kChunk, width - x0);
    // A local count: kept in rows, it would be reloaded after every vector store there.
    int halfCount = 0;
    int i = 0;
    for (; i + 8 <= n; i += 8) Avx2Colours8<kFrom>(in, x0, i, source, rows, halfCount);
    SettleChunk<kFrom>(hueSaturation, in, x0, i, n, halfCount, source, rows);
    for (i = 0; i < n; i += 16) {
      const __m256i l =
          _mm256_min_epi16(_mm256_max_epi16(_mm256_add_epi16(Load256(rows.lightness + i), moveL),
                                            _mm256_setzero_si256()),
                           _mm256_set1_epi16(100));
      __m256i first, second;
      Avx2Lighten16(Load256(rows.coloured + i), Load256(rows.coloured + i + 8), l, first, second);
      _mm256_store_si256(reinterpret_cast<__m256i*>(rows.pixels + i), first);
      _mm256_store_si256(reinterpret_cast<__m256i*>(rows.pixels + i + 8), second);
    }
    StreamOut(rows.pixels, n, out + x0);
  }
  _mm_sfence();
}

// The same 32 pixels at a time, for processors with AVX-512. On those that split these
// registers in two, fewer instructions still mean fewer steps to issue.

// floor(num / den) in 32-bit lanes, as Quotient.
QUILLANE_AVX512_INLINE __m512i WideQuotient(__m512i num, __m512i den) {
  return _mm512_cvttps_epi32(_mm512_div_ps(_mm512_cvtepi32_ps(num), _mm512_cvtepi32_ps(den)));
}

// H * 101 + S and L of 32 pixels in 16-bit lanes, where every value but the quotients' fits;
// the quotients are taken in 32-bit lanes, each half of the register unpacked and packed back
// in place.
struct HslLanes32 {
  __m512i colour, l;
  std::uint32_t halves;
};

// floor((20 sum + 51) / 102) is (20 sum + 51) * 20561 >> 21 for every sum up to 510.
constexpr bool LightnessByMultiplying() {
  for (int sum = 0; sum <= 510; ++sum)
    if ((20 * sum + 51) / 102 != ((20 * sum + 51) * 20561) >> 21) return false;
  return true;
}
static_assert(LightnessByMultiplying());

QUILLANE_AVX512_INLINE __m512i Quotient32(__m512i num, __m512i den) {
  const __m512i zero = _mm512_setzero_si512();
  return _mm512_packus_epi32(
      WideQuotient(_mm512_unpacklo_epi16(num, zero), _mm512_unpacklo_epi16(den, zero)),
      WideQuotient(_mm512_unpackhi_epi16(num, zero), _mm512_unpackhi_epi16(den, zero)));
}

QUILLANE_AVX512_INLINE HslLanes32 Avx512Hsl32(const Pixel* in) {
  const __m512i p0 = _mm512_loadu_si512(in);
  const __m512i p1 = _mm512_loadu_si512(in + 16);
  const __m512i byte = _mm512_set1_epi32(0xFF);
  // Packing takes the 128-bit quarters of both registers in turn: the lanes hold pixels 0-3,
  // 16-19, 4-7, 20-23 and so on until the results are put back in order at the end.
  const __m512i b = _mm512_packus_epi32(_mm512_and_si512(p0, byte), _mm512_and_si512(p1, byte));
  const __m512i g = _mm512_packus_epi32(_mm512_and_si512(_mm512_srli_epi32(p0, 8), byte),
                                        _mm512_and_si512(_mm512_srli_epi32(p1, 8), byte));
  const __m512i r = _mm512_packus_epi32(_mm512_and_si512(_mm512_srli_epi32(p0, 16), byte),
                                        _mm512_and_si512(_mm512_srli_epi32(p1, 16), byte));
  const __m512i mx = _mm512_max_epi16(r, _mm512_max_epi16(g, b));
  const __m512i mn = _mm512_min_epi16(r, _mm512_min_epi16(g, b));
  const __m512i one = _mm512_set1_epi16(1);
  const __m512i zero = _mm512_setzero_si512();
  const __m512i d = _mm512_sub_epi16(mx, mn);
  const __m512i sum = _mm512_add_epi16(mx, mn);
  const __m512i l = _mm512_srli_epi16(
      _mm512_mulhi_epu16(
          _mm512_add_epi16(_mm512_mullo_epi16(sum, _mm512_set1_epi16(20)), _mm512_set1_epi16(51)),
          _mm512_set1_epi16(20561)),
      5);

  // S <= 100 as d <= den, so S * 2 den stays below 2^16 like 200 d + den.
  const __m512i den =
      _mm512_max_epi16(_mm512_min_epi16(sum, _mm512_sub_epi16(_mm512_set1_epi16(510), sum)), one);
  const __m512i twiceDen = _mm512_add_epi16(den, den);
  const __m512i numS = _mm512_add_epi16(_mm512_mullo_epi16(d, _mm512_set1_epi16(200)), den);
  const __m512i s = Quotient32(numS, twiceDen);
  const __mmask32 halfS = _mm512_cmpeq_epi16_mask(_mm512_mullo_epi16(s, twiceDen), numS);

  const __mmask32 redMax = _mm512_cmpeq_epi16_mask(r, mx);
  const __mmask32 greenMax = _mm512_mask_cmpeq_epi16_mask(~redMax, g, mx);
  __m512i signedDistance = _mm512_sub_epi16(r, g);
  signedDistance = _mm512_mask_sub_epi16(signedDistance, greenMax, b, r);
  signedDistance = _mm512_mask_sub_epi16(signedDistance, redMax, g, b);
  __m512i base = _mm512_mask_mov_epi16(_mm512_set1_epi16(240), greenMax, _mm512_set1_epi16(120));
  base = _mm512_mask_mov_epi16(base, redMax, zero);
  const __m512i span = _mm512_max_epi16(d, one);
  const __m512i twiceSpan = _mm512_add_epi16(span, span);
  const __m512i numH = _mm512_add_epi16(
      _mm512_mullo_epi16(_mm512_abs_epi16(signedDistance), _mm512_set1_epi16(120)), span);
  const __m512i steps = Quotient32(numH, twiceSpan);
  const __mmask32 halfH = _mm512_cmpeq_epi16_mask(_mm512_mullo_epi16(steps, twiceSpan), numH);
  const __mmask32 negative = _mm512_cmplt_epi16_mask(signedDistance, zero);
  __m512i h = _mm512_mask_sub_epi16(_mm512_add_epi16(base, steps), negative, base, steps);
  h = _mm512_mask_add_epi16(h, _mm512_cmplt_epi16_mask(h, zero), h, _mm512_set1_epi16(360));

  const __m512i order = _mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7);
  HslLanes32 out;
  out.colour = _mm512_permutexvar_epi64(
      order, _mm512_add_epi16(_mm512_mullo_epi16(h, _mm512_set1_epi16(101)), s));
  out.l = _mm512_permutexvar_epi64(order, l);
  out.halves =
      _mm512_movepi16_mask(_mm512_permutexvar_epi64(order, _mm512_movm_epi16(halfS | halfH)));
  return out;
}

template <LightnessFrom kFrom>
QUILLANE_AVX512_INLINE void Avx512Colours32(const Pixel* in, int x0, int i,
                                            const LightnessSource& source, ChunkRows& rows,
                                            int& halfCount) {
  const HslLanes32 c = Avx512Hsl32(in + x0 + i);
  __m512i l = c.l;
  if constexpr (kFrom == LightnessFrom::Shifted)
    l = _mm512_min_epi16(
        _mm512_max_epi16(_mm512_add_epi16(l, _mm512_loadu_si512(source.shift + x0 + i)),
                         _mm512_setzero_si512()),
        _mm512_set1_epi16(100));
  if constexpr (kFrom == LightnessFrom::Levelled) {
    // Four bytes from each entry (the table is padded for it), the first of them kept.
    const __m512i level = _mm512_cvtepu8_epi16(Load256(source.level + x0 + i));
    const __m512i at = _mm512_add_epi16(_mm512_mullo_epi16(level, _mm512_set1_epi16(101)), l);
    const __m512i zero = _mm512_setzero_si512();
    const __m512i byte = _mm512_set1_epi32(0xFF);
    l = _mm512_packus_epi32(
        _mm512_and_si512(_mm512_i32gather_epi32(_mm512_unpacklo_epi16(at, zero), source.byLevel, 1),
                         byte),
        _mm512_and_si512(_mm512_i32gather_epi32(_mm512_unpackhi_epi16(at, zero), source.byLevel, 1),
                         byte));
  }
  _mm512_store_si512(rows.colour + i, c.colour);
  _mm512_store_si512(rows.lightness + i, l);
  for (int k = 0; k < 4; ++k) ListHalves(rows, halfCount, (c.halves >> (8 * k)) & 0xFF, i + 8 * k);
}

// All ones in the 16-bit lanes whose value v (0..127) has its bit set in words.
QUILLANE_AVX512_INLINE __mmask32 BitSet512(const std::array<std::uint16_t, 8>& words, __m512i v) {
  const __m512i low = _mm512_and_si512(v, _mm512_set1_epi16(15));
  const __m512i lowBits =
      _mm512_broadcast_i32x4(_mm_setr_epi8(1, 2, 4, 8, 16, 32, 64, -128, 0, 0, 0, 0, 0, 0, 0, 0));
  const __m512i highBits =
      _mm512_broadcast_i32x4(_mm_setr_epi8(0, 0, 0, 0, 0, 0, 0, 0, 1, 2, 4, 8, 16, 32, 64, -128));
  const __m512i both = _mm512_mullo_epi16(low, _mm512_set1_epi16(0x0101));
  const __m512i bit = _mm512_or_si512(
      _mm512_and_si512(_mm512_shuffle_epi8(lowBits, both), _mm512_set1_epi16(0x00FF)),
      _mm512_and_si512(_mm512_shuffle_epi8(highBits, both), _mm512_set1_epi16(-256)));
  const __m512i wordIndex =
      _mm512_add_epi16(_mm512_mullo_epi16(_mm512_srli_epi16(v, 4), _mm512_set1_epi16(0x0202)),
                       _mm512_set1_epi16(0x0100));
  const __m512i table =
      _mm512_broadcast_i32x4(_mm_loadu_si128(reinterpret_cast<const __m128i*>(words.data())));
  return _mm512_cmpeq_epi16_mask(_mm512_and_si512(_mm512_shuffle_epi8(table, wordIndex), bit), bit);
}

struct LightTerms512 {
  __m512i m, c, exactOffset, exactBit;
};

// LightTermsOf for 32 lanes.
QUILLANE_AVX512_INLINE LightTerms512 LightTermsOf512(__m512i l) {
  LightTerms512 t;
  const __mmask32 bright = _mm512_cmpgt_epi16_mask(l, _mm512_set1_epi16(50));
  t.m = _mm512_mask_sub_epi16(l, bright, _mm512_set1_epi16(100), l);
  const __mmask32 exact = _mm512_cmpeq_epi16_mask(l, _mm512_set1_epi16(25)) |
                          _mm512_cmpeq_epi16_mask(l, _mm512_set1_epi16(75));
  const __mmask32 down = BitSet512(LightnessBelow(), l) | exact;
  t.c =
      _mm512_add_epi16(_mm512_maskz_mullo_epi16(bright, _mm512_sub_epi16(l, _mm512_set1_epi16(50)),
                                                _mm512_set1_epi16(255)),
                       _mm512_mask_sub_epi16(_mm512_set1_epi16(25), down, _mm512_set1_epi16(25),
                                             _mm512_set1_epi16(1)));
  t.exactOffset = _mm512_maskz_mov_epi16(exact & bright, _mm512_set1_epi16(255));
  t.exactBit = _mm512_maskz_mov_epi16(exact, _mm512_set1_epi16(1));
  return t;
}

QUILLANE_AVX512_INLINE __m512i LightBlend512(__m512i x, const LightTerms512& t) {
  const __m512i evenHalf =
      _mm512_and_si512(_mm512_srli_epi16(_mm512_add_epi16(x, t.exactOffset), 1), t.exactBit);
  const __m512i n = _mm512_add_epi16(_mm512_add_epi16(_mm512_mullo_epi16(x, t.m), t.c), evenHalf);
  return _mm512_srli_epi16(_mm512_mulhi_epu16(n, _mm512_set1_epi16(-23592)), 5);  // 41944
}

// Avx2Lighten16 for 32 pixels; packing keeps 128-bit quarters apart, so the channels come in
// groups of four pixels from first and second in turn.
QUILLANE_AVX512_INLINE void Avx512Lighten32(__m512i first, __m512i second, __m512i l, __m512i& out0,
                                            __m512i& out1) {
  const __m512i byte = _mm512_set1_epi32(0xFF);
  const __m512i blue =
      _mm512_packus_epi32(_mm512_and_si512(first, byte), _mm512_and_si512(second, byte));
  const __m512i green = _mm512_packus_epi32(_mm512_and_si512(_mm512_srli_epi32(first, 8), byte),
                                            _mm512_and_si512(_mm512_srli_epi32(second, 8), byte));
  const __m512i red =
      _mm512_packus_epi32(_mm512_srli_epi32(first, 16), _mm512_srli_epi32(second, 16));
  const LightTerms512 t =
      LightTermsOf512(_mm512_permutexvar_epi64(_mm512_setr_epi64(0, 4, 1, 5, 2, 6, 3, 7), l));
  const __m512i blueGreen =
      _mm512_or_si512(LightBlend512(blue, t), _mm512_slli_epi16(LightBlend512(green, t), 8));
  const __m512i redAlpha = _mm512_or_si512(LightBlend512(red, t), _mm512_set1_epi16(-256));
  out0 = _mm512_unpacklo_epi16(blueGreen, redAlpha);
  out1 = _mm512_unpackhi_epi16(blueGreen, redAlpha);
}

// The changed hue and saturation of 32 pixels (0x00RRGGBB) from the table at their colours
// (H * 101 + S), gathered: pixels 0..15 in first, 16..31 in second.
QUILLANE_AVX512_INLINE void GatherColoured(const std::uint32_t* hueSaturation,
                                           const std::uint16_t* colour, __m512i& first,
                                           __m512i& second) {
  const __m512i at = _mm512_load_si512(colour);
  first =
      _mm512_i32gather_epi32(_mm512_cvtepu16_epi32(_mm512_castsi512_si256(at)), hueSaturation, 4);
  second = _mm512_i32gather_epi32(_mm512_cvtepu16_epi32(_mm512_extracti64x4_epi64(at, 1)),
                                  hueSaturation, 4);
}

// kGather: the blend gathers the changed hue and saturation from the table itself, which is
// quicker than looking them up one by one where gathers run at full speed.
template <LightnessFrom kFrom, bool kGather>
QUILLANE_AVX512 void Avx512Row(const HslChange& change, const std::uint32_t* hueSaturation,
                               const Pixel* in, Pixel* out, int width,
                               const LightnessSource& source) {
  ChunkRows rows;
  const __m512i moveL = _mm512_set1_epi16(static_cast<std::int16_t>(change.lightnessShift));
  for (int x0 = 0; x0 < width; x0 += kChunk) {
    const int n = std::min(kChunk, width - x0);
    // A local count: kept in rows, it would be reloaded after every vector store there.
    int halfCount = 0;
    int i = 0;
    for (; i + 32 <= n; i += 32) Avx512Colours32<kFrom>(in, x0, i, source, rows, halfCount);
    for (; i + 8 <= n; i += 8) Avx2Colours8<kFrom>(in, x0, i, source, rows, halfCount);
    SettleChunk<kFrom, !kGather>(hueSaturation, in, x0, i, n, halfCount, source, rows);
    for (i = 0; i < n; i += 32) {
      const __m512i l = _mm512_min_epi16(
          _mm512_max_epi16(_mm512_add_epi16(_mm512_load_si512(rows.lightness + i), moveL),
                           _mm512_setzero_si512()),
          _mm512_set1_epi16(100));
      __m512i coloured0, coloured1, first, second;
      if constexpr (kGather) {
        GatherColoured(hueSaturation, rows.colour + i, coloured0, coloured1);
      } else {
        coloured0 = _mm512_load_si512(rows.coloured + i);
        coloured1 = _mm512_load_si512(rows.coloured + i + 16);
      }
      Avx512Lighten32(coloured0, coloured1, l, first, second);
      _mm512_store_si512(rows.pixels + i, first);
      _mm512_store_si512(rows.pixels + i + 16, second);
    }
    StreamOut(rows.pixels, n, out + x0);
  }
  _mm_sfence();
}
#endif

template <LightnessFrom kFrom>
void ChangeRow([[maybe_unused]] const HslChange& change, const std::uint32_t* hueSaturation,
               const std::uint8_t* lightRows, const Pixel* in, Pixel* out, int width,
               const LightnessSource& source) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx512Gathers())
    return Avx512Row<kFrom, true>(change, hueSaturation, in, out, width, source);
  if (UseAvx512()) return Avx512Row<kFrom, false>(change, hueSaturation, in, out, width, source);
  if (UseAvx2()) return Avx2Row<kFrom>(change, hueSaturation, in, out, width, source);
#endif
  PlainRow<kFrom>(hueSaturation, lightRows, in, out, 0, width, source);
}

}  // namespace

void RgbToHslRow(const Pixel* in, Hsl* out, int n) {
#if defined(__x86_64__) && defined(__GNUC__)
  if (UseAvx2()) return Avx2HslRow(in, out, n);
#endif
  PlainHslRow(in, out, n);
}

HslRowChanger::HslRowChanger(const HslChange& wanted)
    : hueSaturation_(360 * 101), lightRows_(101 * 256) {
  // Shifts beyond 100 either way leave every value at a limit, as 100 does.
  change_.hueTurn = (wanted.hueTurn % 360 + 360) % 360;
  change_.saturationShift = std::clamp(wanted.saturationShift, -100, 100);
  change_.lightnessShift = std::clamp(wanted.lightnessShift, -100, 100);
  const HslChange& change = change_;
  const HslTables& t = HslToRgbTables();
  const auto limited = [](int v) { return std::clamp(v, 0, 100); };
  for (int h = 0; h < 360; ++h) {
    const std::uint8_t* hue = t.hue[((h + change.hueTurn) % 360 + 360) % 360];
    for (int s = 0; s < 101; ++s) {
      const std::uint8_t* sat = t.saturation[limited(s + change.saturationShift)];
      hueSaturation_[static_cast<std::size_t>(h * 101 + s)] =
          static_cast<std::uint32_t>(sat[hue[0]]) << 16 |
          static_cast<std::uint32_t>(sat[hue[1]]) << 8 | sat[hue[2]];
    }
  }
  for (int l = 0; l <= 100; ++l)
    std::memcpy(&lightRows_[static_cast<std::size_t>(l) * 256],
                t.lightness[limited(l + change.lightnessShift)], 256);
}

void HslRowChanger::Row(const Pixel* in, Pixel* out, int width,
                        const std::int16_t* lightnessShift) const {
  LightnessSource source;
  source.shift = lightnessShift;
  if (lightnessShift == nullptr)
    ChangeRow<LightnessFrom::Own>(change_, hueSaturation_.data(), lightRows_.data(), in, out, width,
                                  source);
  else
    ChangeRow<LightnessFrom::Shifted>(change_, hueSaturation_.data(), lightRows_.data(), in, out,
                                      width, source);
}

void HslRowChanger::RowWithLevels(const Pixel* in, Pixel* out, int width,
                                  const std::uint8_t* levels,
                                  const LightnessByLevel& lightness) const {
  LightnessSource source;
  source.level = levels;
  source.byLevel = lightness.at.data();
  ChangeRow<LightnessFrom::Levelled>(change_, hueSaturation_.data(), lightRows_.data(), in, out,
                                     width, source);
}

}  // namespace quillane
