// Saturating addition with SSE2, four pixels a step.
#include "imageutility/kernels/AddBlend.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline __m128i Add(__m128i s, __m128i d, __m128i opacity) {
    const __m128i lowBytes = _mm_set1_epi16(0x00FF);
    const __m128i alpha = _mm_srli_epi32(s, 24);
    // 256 times the weight, so that the high half of a product is (s * w) >> 8.
    const __m128i w = _mm_andnot_si128(
        lowBytes, _mm_mullo_epi16(_mm_or_si128(alpha, _mm_slli_epi32(alpha, 16)), opacity));
    const __m128i redBlue = _mm_mulhi_epu16(_mm_and_si128(s, lowBytes), w);
    // The source's alpha adds nothing.
    const __m128i green = _mm_and_si128(
        _mm_mulhi_epu16(_mm_and_si128(s, _mm_set1_epi32(0xFF00)), w), _mm_set1_epi32(0xFF00));
    return _mm_adds_epu8(d, _mm_or_si128(redBlue, green));
}

} // namespace

void AddBlend_sse2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m128i factor = _mm_set1_epi16(static_cast<short>(opacity + 1));
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(dst + i * 4);
        const __m128i s = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
        _mm_storeu_si128(out, Add(s, _mm_loadu_si128(out), factor));
    }
    AddBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
