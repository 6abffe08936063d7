// Straight-alpha "over" with AVX2, eight pixels a step.
#include "imageutility/kernels/CompositeOver.h"

#include <immintrin.h>

namespace kyv {
namespace {

inline __m256i Twice(__m256i low) {
    return _mm256_or_si256(low, _mm256_slli_epi32(low, 16));
}

// The quotient, below 256, of a numerator below 2^17 and a divisor up to 255. A half more keeps it
// 1/510 away from the next integers, and single precision errs by less than 1/32768.
inline __m256i Divide(__m256i numerator, __m256 reciprocal) {
    const __m256 n = _mm256_add_ps(_mm256_cvtepi32_ps(numerator), _mm256_set1_ps(0.5F));
    return _mm256_cvttps_epi32(_mm256_mul_ps(n, reciprocal));
}

// Both alphas, 32 bits each, not 0.
inline __m256i Mix(__m256i s, __m256i d, __m256i a, __m256i under) {
    const __m256i lowBytes = _mm256_set1_epi16(0x00FF);
    const __m256i lowWords = _mm256_set1_epi32(0xFFFF);
    // x / 255 is (x * 0x8081) >> 23 for 16 bits.
    const __m256i product = _mm256_mullo_epi16(a, under);
    const __m256i quotient =
        _mm256_srli_epi16(_mm256_mulhi_epu16(product, _mm256_set1_epi32(0x8081)), 7);
    const __m256i out = _mm256_sub_epi32(_mm256_add_epi32(a, under), quotient);
    // Terms of 16 bits: blue and red together, then green beside zero.
    const __m256i wOver = Twice(a);
    const __m256i wUnder = _mm256_sub_epi16(_mm256_set1_epi16(256), wOver);
    const __m256i underHigh = _mm256_slli_epi16(Twice(under), 8);
    const __m256i over = _mm256_mullo_epi16(_mm256_and_si256(s, lowBytes), wOver);
    const __m256i below =
        _mm256_mulhi_epu16(_mm256_mullo_epi16(_mm256_and_si256(d, lowBytes), wUnder), underHigh);
    const __m256i sGreen = _mm256_and_si256(_mm256_srli_epi16(s, 8), lowWords);
    const __m256i dGreen = _mm256_and_si256(_mm256_srli_epi16(d, 8), lowWords);
    const __m256i green =
        _mm256_add_epi32(_mm256_mullo_epi16(sGreen, wOver),
                         _mm256_mulhi_epu16(_mm256_mullo_epi16(dGreen, wUnder), underHigh));
    const __m256i blue =
        _mm256_add_epi32(_mm256_and_si256(over, lowWords), _mm256_and_si256(below, lowWords));
    const __m256i red = _mm256_add_epi32(_mm256_srli_epi32(over, 16), _mm256_srli_epi32(below, 16));
    // No quotient is above 255, so nothing is left to clamp.
    const __m256 reciprocal = _mm256_div_ps(_mm256_set1_ps(1.0F), _mm256_cvtepi32_ps(out));
    const __m256i bg =
        _mm256_or_si256(Divide(blue, reciprocal), _mm256_slli_epi32(Divide(green, reciprocal), 8));
    const __m256i ra = _mm256_or_si256(Divide(red, reciprocal), _mm256_slli_epi32(out, 8));
    return _mm256_or_si256(bg, _mm256_slli_epi32(ra, 16));
}

} // namespace

void CompositeOver_avx2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m256i factor = _mm256_set1_epi32(opacity + 1);
    const __m256i zero = _mm256_setzero_si256();
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(dst + i * 4);
        const __m256i s = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        const __m256i a =
            _mm256_srli_epi32(_mm256_mullo_epi16(_mm256_srli_epi32(s, 24), factor), 8);
        const __m256i keeps = _mm256_cmpeq_epi32(a, zero);
        // Sprites have wide clear and opaque areas.
        if (_mm256_movemask_epi8(keeps) == -1) {
            continue;
        }
        const __m256i d = _mm256_loadu_si256(out);
        const __m256i under = _mm256_srli_epi32(d, 24);
        const __m256i copies = _mm256_or_si256(_mm256_cmpeq_epi32(a, _mm256_set1_epi32(255)),
                                               _mm256_cmpeq_epi32(under, zero));
        __m256i result = _mm256_or_si256(_mm256_and_si256(s, _mm256_set1_epi32(0x00FFFFFF)),
                                         _mm256_slli_epi32(a, 24));
        if (_mm256_movemask_epi8(_mm256_or_si256(keeps, copies)) != -1) {
            result = _mm256_blendv_epi8(Mix(s, d, a, under), result, copies);
        }
        _mm256_storeu_si256(out, _mm256_blendv_epi8(result, d, keeps));
    }
    CompositeOver_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
