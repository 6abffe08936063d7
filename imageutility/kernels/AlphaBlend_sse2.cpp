// Alpha blend with SSE2, four pixels a step.
#include "imageutility/kernels/AlphaBlend.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
// s * w + d * (256 - w) is at most 255 * 256, so (s - d) * w + 256 * d is right in 16 bits whatever
// overflows on the way.
inline __m128i Blend(__m128i s, __m128i d, __m128i opacity) {
    const __m128i lowBytes = _mm_set1_epi16(0x00FF);
    const __m128i alpha = _mm_srli_epi32(s, 24);
    const __m128i w =
        _mm_srli_epi16(_mm_mullo_epi16(_mm_or_si128(alpha, _mm_slli_epi32(alpha, 16)), opacity), 8);
    const __m128i sRedBlue = _mm_and_si128(s, lowBytes);
    const __m128i dRedBlue = _mm_and_si128(d, lowBytes);
    const __m128i redBlue = _mm_add_epi16(_mm_mullo_epi16(_mm_sub_epi16(sRedBlue, dRedBlue), w),
                                          _mm_slli_epi16(dRedBlue, 8));
    // A weight of 0 keeps alpha.
    const __m128i wGreen = _mm_and_si128(w, _mm_set1_epi32(0xFFFF));
    const __m128i difference = _mm_sub_epi16(_mm_srli_epi16(s, 8), _mm_srli_epi16(d, 8));
    const __m128i greenAlpha =
        _mm_add_epi16(_mm_mullo_epi16(difference, wGreen), _mm_andnot_si128(lowBytes, d));
    return _mm_or_si128(_mm_srli_epi16(redBlue, 8), _mm_andnot_si128(lowBytes, greenAlpha));
}

} // namespace

void AlphaBlend_sse2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m128i factor = _mm_set1_epi16(static_cast<short>(opacity + 1));
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(dst + i * 4);
        const __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
        _mm_storeu_si128(out, Blend(s, _mm_loadu_si128(out), factor));
    }
    AlphaBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
