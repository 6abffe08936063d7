// Screen with AVX2, eight pixels a step.
#include "imageutility/kernels/ScreenBlend.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline __m256i Screen(__m256i s, __m256i d) {
    const __m256i colors = _mm256_set1_epi32(0x00FFFFFF);
    const __m256i lowBytes = _mm256_set1_epi16(0x00FF);
    const __m256i u = _mm256_xor_si256(s, colors);
    const __m256i v = _mm256_xor_si256(d, colors);
    const __m256i redBlue = _mm256_srli_epi16(
        _mm256_mullo_epi16(_mm256_and_si256(u, lowBytes), _mm256_and_si256(v, lowBytes)), 8);
    const __m256i green =
        _mm256_and_si256(_mm256_mullo_epi16(_mm256_srli_epi16(u, 8), _mm256_srli_epi16(v, 8)),
                         _mm256_set1_epi32(0xFF00));
    const __m256i alpha = _mm256_andnot_si256(colors, d);
    return _mm256_or_si256(_mm256_xor_si256(_mm256_or_si256(redBlue, green), colors), alpha);
}

} // namespace

void ScreenBlend_avx2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(dst + i * 4);
        const __m256i s = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        _mm256_storeu_si256(out, Screen(s, _mm256_loadu_si256(out)));
    }
    ScreenBlend_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
