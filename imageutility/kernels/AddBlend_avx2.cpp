// Saturating addition with AVX2, eight pixels a step.
#include "imageutility/kernels/AddBlend.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline __m256i Add(__m256i s, __m256i d, __m256i opacity) {
    const __m256i lowBytes = _mm256_set1_epi16(0x00FF);
    const __m256i alphaTwice = _mm256_broadcastsi128_si256(
        _mm_setr_epi8(3, -1, 3, -1, 7, -1, 7, -1, 11, -1, 11, -1, 15, -1, 15, -1));
    // 256 times the weight, so that the high half of a product is (s * w) >> 8.
    const __m256i w = _mm256_andnot_si256(
        lowBytes, _mm256_mullo_epi16(_mm256_shuffle_epi8(s, alphaTwice), opacity));
    const __m256i redBlue = _mm256_mulhi_epu16(_mm256_and_si256(s, lowBytes), w);
    // The source's alpha adds nothing.
    const __m256i green =
        _mm256_and_si256(_mm256_mulhi_epu16(_mm256_and_si256(s, _mm256_set1_epi32(0xFF00)), w),
                         _mm256_set1_epi32(0xFF00));
    return _mm256_adds_epu8(d, _mm256_or_si256(redBlue, green));
}

} // namespace

void AddBlend_avx2(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const __m256i factor = _mm256_set1_epi16(static_cast<short>(opacity + 1));
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(dst + i * 4);
        const __m256i s = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        _mm256_storeu_si256(out, Add(s, _mm256_loadu_si256(out), factor));
    }
    AddBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv
