// Luma with SSE2.
#include "imageutility/kernels/ToGray.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m128i Factors(int low, int high) {
    return _mm_set1_epi32(high << 16 | low);
}

inline __m128i Load(const uint8_t* pixels) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(pixels));
}

// The luma of four pixels, 32 bits each. The constant rides on a word of 64 beside green.
inline __m128i Luma(__m128i bgra) {
    const __m128i br = _mm_and_si128(bgra, _mm_set1_epi32(0x00FF00FF));
    const __m128i gc = _mm_or_si128(_mm_and_si128(_mm_srli_epi32(bgra, 8), _mm_set1_epi32(0xFF)),
                                    _mm_set1_epi32(64 << 16));
    return _mm_srli_epi32(_mm_add_epi32(_mm_madd_epi16(br, Factors(401, 1053)),
                                        _mm_madd_epi16(gc, Factors(2064, 1056))),
                          12);
}

} // namespace

void ToGray_sse2(uint8_t* pixels, size_t count) {
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i bgra = Load(pixels + i * 4);
        const __m128i luma = Luma(bgra);
        const __m128i two = _mm_or_si128(luma, _mm_slli_epi32(luma, 8));
        const __m128i three = _mm_or_si128(two, _mm_slli_epi32(luma, 16));
        const __m128i alpha = _mm_and_si128(bgra, _mm_set1_epi32(-0x1000000));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(pixels + i * 4), _mm_or_si128(three, alpha));
    }
    ToGray_scalar(pixels + i * 4, count - i);
}

void ToGrayBytes_sse2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 16 <= count; i += 16) {
        const uint8_t* from = src + i * 4;
        const __m128i low = _mm_packs_epi32(Luma(Load(from)), Luma(Load(from + 16)));
        const __m128i high = _mm_packs_epi32(Luma(Load(from + 32)), Luma(Load(from + 48)));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i), _mm_packus_epi16(low, high));
    }
    ToGrayBytes_scalar(dst + i, src + i * 4, count - i);
}

} // namespace kyv
