// Luma with SSSE3, whose byte shuffle spreads it over a pixel.
#include "imageutility/kernels/ToGray.h"

#include <tmmintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m128i Factors(int low, int high) {
    return _mm_set1_epi32(high << 16 | low);
}

} // namespace

void ToGray_ssse3(uint8_t* pixels, size_t count) {
    const __m128i spread = _mm_setr_epi8(2, 2, 2, -1, 6, 6, 6, -1, 10, 10, 10, -1, 14, 14, 14, -1);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* four = reinterpret_cast<__m128i*>(pixels + i * 4);
        const __m128i bgra = _mm_loadu_si128(four);
        const __m128i br = _mm_and_si128(bgra, _mm_set1_epi32(0x00FF00FF));
        // Sixteenfold sums have the luma in byte 2. 16 x 2064 would not fit 16 bits; green is
        // doubled instead. The constant rides on a word of 1024 beside it.
        const __m128i gc =
            _mm_or_si128(_mm_and_si128(_mm_srli_epi32(bgra, 7), _mm_set1_epi32(0x1FE)),
                         _mm_set1_epi32(1024 << 16));
        const __m128i luma = _mm_add_epi32(_mm_madd_epi16(br, Factors(16 * 401, 16 * 1053)),
                                           _mm_madd_epi16(gc, Factors(8 * 2064, 1056)));
        const __m128i alpha = _mm_and_si128(bgra, _mm_set1_epi32(-0x1000000));
        _mm_storeu_si128(four, _mm_or_si128(_mm_shuffle_epi8(luma, spread), alpha));
    }
    ToGray_scalar(pixels + i * 4, count - i);
}

} // namespace kyv
