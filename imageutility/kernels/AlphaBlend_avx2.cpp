// Alpha blend with AVX2, eight pixels a step.
#include "imageutility/kernels/AlphaBlend.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
// s * w + d * (256 - w) is at most 255 * 256, so (s - d) * w + 256 * d is right in 16 bits whatever
// overflows on the way.
inline __m256i Blend(__m256i s, __m256i d, __m256i opacity) {
    const __m256i lowBytes = _mm256_set1_epi16(0x00FF);
    const __m256i alphaTwice = _mm256_broadcastsi128_si256(
        _mm_setr_epi8(3, -1, 3, -1, 7, -1, 7, -1, 11, -1, 11, -1, 15, -1, 15, -1));
    const __m256i w =
        _mm256_srli_epi16(_mm256_mullo_epi16(_mm256_shuffle_epi8(s, alphaTwice), opacity), 8);
    const __m256i sRedBlue = _mm256_and_si256(s, lowBytes);
    const __m256i dRedBlue = _mm256_and_si256(d, lowBytes);
    const __m256i redBlue =
        _mm256_add_epi16(_mm256_mullo_epi16(_mm256_sub_epi16(sRedBlue, dRedBlue), w),
                         _mm256_slli_epi16(dRedBlue, 8));
    // A weight of 0 keeps alpha.
    const __m256i wGreen = _mm256_and_si256(w, _mm256_set1_epi32(0xFFFF));
    const __m256i difference = _mm256_sub_epi16(_mm256_srli_epi16(s, 8), _mm256_srli_epi16(d, 8));
    const __m256i greenAlpha =
        _mm256_add_epi16(_mm256_mullo_epi16(difference, wGreen), _mm256_andnot_si256(lowBytes, d));
    return _mm256_or_si256(_mm256_srli_epi16(redBlue, 8),
                           _mm256_andnot_si256(lowBytes, greenAlpha));
}

} // namespace

void AlphaBlend_avx2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m256i factor = _mm256_set1_epi16(static_cast<short>(opacity + 1));
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(dst + i * 4);
        const __m256i s = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        _mm256_storeu_si256(out, Blend(s, _mm256_loadu_si256(out), factor));
    }
    AlphaBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
