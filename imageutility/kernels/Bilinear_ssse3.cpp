// Bilinear resizing with SSSE3, four pixels a step.
#include "imageutility/kernels/Bilinear.h"

#include <tmmintrin.h>

namespace kyv {
namespace {

// Two pixels less 128, 16 bits a channel. The weights go up to 128, which only the unsigned operand
// holds, so the pixels are the signed one.
inline __m128i Interpolate(const uint8_t* src, const int32_t* left, __m128i weights) {
    const __m128i interleave = _mm_setr_epi8(0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15);
    const auto* first = reinterpret_cast<const __m128i*>(src + static_cast<ptrdiff_t>(left[0]) * 4);
    const auto* second = reinterpret_cast<const double*>(src + static_cast<ptrdiff_t>(left[1]) * 4);
    const __m128i pairs =
        _mm_castpd_si128(_mm_loadh_pd(_mm_castsi128_pd(_mm_loadl_epi64(first)), second));
    const __m128i centered = _mm_xor_si128(pairs, _mm_set1_epi8(-128));
    return _mm_srai_epi16(_mm_maddubs_epi16(weights, _mm_shuffle_epi8(centered, interleave)), 7);
}

} // namespace

void Bilinear_ssse3(uint8_t* dst, const uint8_t* src, size_t count,
                    const BilinearColumns& columns) {
    const __m128i spreadFirst = _mm_setr_epi8(0, 1, 0, 1, 0, 1, 0, 1, 2, 3, 2, 3, 2, 3, 2, 3);
    const __m128i spreadSecond = _mm_add_epi8(spreadFirst, _mm_set1_epi8(4));
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i weights =
            _mm_loadl_epi64(reinterpret_cast<const __m128i*>(columns.weights + 2 * i));
        const __m128i first =
            Interpolate(src, columns.left + i, _mm_shuffle_epi8(weights, spreadFirst));
        const __m128i second =
            Interpolate(src, columns.left + i + 2, _mm_shuffle_epi8(weights, spreadSecond));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4),
                         _mm_xor_si128(_mm_packs_epi16(first, second), _mm_set1_epi8(-128)));
    }
    Bilinear_scalar(dst + i * 4, src, count - i, {columns.left + i, columns.weights + 2 * i});
}

void Lerp_ssse3(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
                uint32_t fraction) {
    // Weights up to 127 fit in signed bytes. A fraction of 0 takes both halves from the upper row.
    const uint8_t* second = fraction == 0 ? upper : lower;
    const uint32_t f = fraction == 0 ? 64 : fraction;
    const __m128i weights = _mm_set1_epi16(static_cast<short>((f << 8) | (128 - f)));
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i a = _mm_loadu_si128(reinterpret_cast<const __m128i*>(upper + i * 4));
        const __m128i b = _mm_loadu_si128(reinterpret_cast<const __m128i*>(second + i * 4));
        const __m128i low = _mm_maddubs_epi16(_mm_unpacklo_epi8(a, b), weights);
        const __m128i high = _mm_maddubs_epi16(_mm_unpackhi_epi8(a, b), weights);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4),
                         _mm_packus_epi16(_mm_srli_epi16(low, 7), _mm_srli_epi16(high, 7)));
    }
    Lerp_scalar(dst + i * 4, upper + i * 4, lower + i * 4, count - i, fraction);
}

} // namespace kyv
