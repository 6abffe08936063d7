// Screen with SSE2, four pixels a step.
#include "imageutility/kernels/ScreenBlend.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline __m128i Screen(__m128i s, __m128i d) {
    const __m128i colors = _mm_set1_epi32(0x00FFFFFF);
    const __m128i lowBytes = _mm_set1_epi16(0x00FF);
    const __m128i u = _mm_xor_si128(s, colors);
    const __m128i v = _mm_xor_si128(d, colors);
    const __m128i redBlue =
        _mm_srli_epi16(_mm_mullo_epi16(_mm_and_si128(u, lowBytes), _mm_and_si128(v, lowBytes)), 8);
    const __m128i green = _mm_and_si128(_mm_mullo_epi16(_mm_srli_epi16(u, 8), _mm_srli_epi16(v, 8)),
                                        _mm_set1_epi32(0xFF00));
    const __m128i alpha = _mm_andnot_si128(colors, d);
    return _mm_or_si128(_mm_xor_si128(_mm_or_si128(redBlue, green), colors), alpha);
}

} // namespace

void ScreenBlend_sse2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(dst + i * 4);
        const __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
        _mm_storeu_si128(out, Screen(s, _mm_loadu_si128(out)));
    }
    ScreenBlend_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
