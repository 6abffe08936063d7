// Straight-alpha "over" with SSE2, four pixels a step.
#include "imageutility/kernels/CompositeOver.h"

#include <emmintrin.h>

namespace kyv {
namespace {

inline __m128i Choose(__m128i mask, __m128i yes, __m128i no) {
    return _mm_or_si128(_mm_and_si128(mask, yes), _mm_andnot_si128(mask, no));
}

inline __m128i Twice(__m128i low) {
    return _mm_or_si128(low, _mm_slli_epi32(low, 16));
}

// The quotient, below 256, of a numerator below 2^17 and a divisor up to 255. A half more keeps it
// 1/510 away from the next integers, and single precision errs by less than 1/32768.
inline __m128i Divide(__m128i numerator, __m128 reciprocal) {
    const __m128 n = _mm_add_ps(_mm_cvtepi32_ps(numerator), _mm_set1_ps(0.5F));
    return _mm_cvttps_epi32(_mm_mul_ps(n, reciprocal));
}

// Both alphas, 32 bits each, not 0.
inline __m128i Mix(__m128i s, __m128i d, __m128i a, __m128i under) {
    const __m128i lowBytes = _mm_set1_epi16(0x00FF);
    const __m128i lowWords = _mm_set1_epi32(0xFFFF);
    // x / 255 is (x * 0x8081) >> 23 for 16 bits.
    const __m128i product = _mm_mullo_epi16(a, under);
    const __m128i quotient = _mm_srli_epi16(_mm_mulhi_epu16(product, _mm_set1_epi32(0x8081)), 7);
    const __m128i out = _mm_sub_epi32(_mm_add_epi32(a, under), quotient);
    // Terms of 16 bits: blue and red together, then green beside zero.
    const __m128i wOver = Twice(a);
    const __m128i wUnder = _mm_sub_epi16(_mm_set1_epi16(256), wOver);
    const __m128i underHigh = _mm_slli_epi16(Twice(under), 8);
    const __m128i over = _mm_mullo_epi16(_mm_and_si128(s, lowBytes), wOver);
    const __m128i below =
        _mm_mulhi_epu16(_mm_mullo_epi16(_mm_and_si128(d, lowBytes), wUnder), underHigh);
    const __m128i sGreen = _mm_and_si128(_mm_srli_epi16(s, 8), lowWords);
    const __m128i dGreen = _mm_and_si128(_mm_srli_epi16(d, 8), lowWords);
    const __m128i green =
        _mm_add_epi32(_mm_mullo_epi16(sGreen, wOver),
                      _mm_mulhi_epu16(_mm_mullo_epi16(dGreen, wUnder), underHigh));
    const __m128i blue =
        _mm_add_epi32(_mm_and_si128(over, lowWords), _mm_and_si128(below, lowWords));
    const __m128i red = _mm_add_epi32(_mm_srli_epi32(over, 16), _mm_srli_epi32(below, 16));
    // No quotient is above 255, so nothing is left to clamp.
    const __m128 reciprocal = _mm_div_ps(_mm_set1_ps(1.0F), _mm_cvtepi32_ps(out));
    const __m128i bg =
        _mm_or_si128(Divide(blue, reciprocal), _mm_slli_epi32(Divide(green, reciprocal), 8));
    const __m128i ra = _mm_or_si128(Divide(red, reciprocal), _mm_slli_epi32(out, 8));
    return _mm_or_si128(bg, _mm_slli_epi32(ra, 16));
}

} // namespace

void CompositeOver_sse2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m128i factor = _mm_set1_epi32(opacity + 1);
    const __m128i zero = _mm_setzero_si128();
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(dst + i * 4);
        const __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
        const __m128i a = _mm_srli_epi32(_mm_mullo_epi16(_mm_srli_epi32(s, 24), factor), 8);
        const __m128i keeps = _mm_cmpeq_epi32(a, zero);
        // Sprites have wide clear and opaque areas.
        if (_mm_movemask_epi8(keeps) == 0xFFFF) {
            continue;
        }
        const __m128i d = _mm_loadu_si128(out);
        const __m128i under = _mm_srli_epi32(d, 24);
        const __m128i copies =
            _mm_or_si128(_mm_cmpeq_epi32(a, _mm_set1_epi32(255)), _mm_cmpeq_epi32(under, zero));
        __m128i result =
            _mm_or_si128(_mm_and_si128(s, _mm_set1_epi32(0x00FFFFFF)), _mm_slli_epi32(a, 24));
        if (_mm_movemask_epi8(_mm_or_si128(keeps, copies)) != 0xFFFF) {
            result = Choose(copies, result, Mix(s, d, a, under));
        }
        _mm_storeu_si128(out, Choose(keeps, d, result));
    }
    CompositeOver_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
