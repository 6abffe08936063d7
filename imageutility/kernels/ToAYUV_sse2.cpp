// ARGB to AYUV with SSE2, four pixels a step.
#include "imageutility/kernels/ToAYUV.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m128i Factors(int low, int high) {
    return _mm_set1_epi32(static_cast<int>((static_cast<unsigned>(high) << 16) |
                                           (static_cast<unsigned>(low) & 0xFFFF)));
}

// All sums are kept sixteenfold, so that a result is byte 2 of its sum. 16 x 2064 would not fit 16
// bits; green is doubled instead. The constants ride on a word of 1024 beside it.
inline __m128i Weigh(__m128i br, __m128i gc, __m128i brFactors, __m128i gcFactors) {
    return _mm_add_epi32(_mm_madd_epi16(br, brFactors), _mm_madd_epi16(gc, gcFactors));
}

inline __m128i Convert(__m128i bgra) {
    const __m128i br = _mm_and_si128(bgra, _mm_set1_epi32(0x00FF00FF));
    const __m128i gc = _mm_or_si128(_mm_and_si128(_mm_srli_epi32(bgra, 7), _mm_set1_epi32(0x1FE)),
                                    _mm_set1_epi32(1024 << 16));
    const __m128i y = Weigh(br, gc, Factors(16 * 401, 16 * 1053), Factors(8 * 2064, 1056));
    const __m128i u = Weigh(br, gc, Factors(16 * 1798, 16 * -606), Factors(8 * -1192, 8224));
    const __m128i v = Weigh(br, gc, Factors(16 * -291, 16 * 1798), Factors(8 * -1507, 8224));
    const __m128i vu = _mm_or_si128(_mm_srli_epi32(v, 16),
                                    _mm_and_si128(_mm_srli_epi32(u, 8), _mm_set1_epi32(0xFF00)));
    const __m128i ya = _mm_or_si128(_mm_and_si128(y, _mm_set1_epi32(0xFF0000)),
                                    _mm_and_si128(bgra, _mm_set1_epi32(-0x1000000)));
    return _mm_or_si128(vu, ya);
}

} // namespace

void ToAYUV_sse2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i bgra = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), Convert(bgra));
    }
    ToAYUV_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
