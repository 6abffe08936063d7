// Contrast with AVX2, eight pixels a step.
#include "imageutility/kernels/Contrast.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Eight words x - 128 in 1/256 become (x - 128) * factor, rounded: 8 * factor / 32768 is
// factor / 4096.
inline __m256i Scale(__m256i centered, __m256i factors) {
    return _mm256_mulhrs_epi16(_mm256_srai_epi16(centered, 5), factors);
}

} // namespace

void Contrast_avx2(uint8_t* pixels, size_t count, int32_t factor) {
    // A factor of 1 keeps alpha.
    const auto k = static_cast<short>(factor);
    const __m256i factors =
        _mm256_broadcastsi128_si256(_mm_setr_epi16(k, k, k, 4096, k, k, k, 4096));
    const __m256i center = _mm256_set1_epi8(-128);
    const __m256i zero = _mm256_setzero_si256();
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(pixels + i * 4);
        const __m256i x = _mm256_xor_si256(_mm256_loadu_si256(out), center);
        const __m256i low = Scale(_mm256_unpacklo_epi8(zero, x), factors);
        const __m256i high = Scale(_mm256_unpackhi_epi8(zero, x), factors);
        _mm256_storeu_si256(out, _mm256_xor_si256(_mm256_packs_epi16(low, high), center));
    }
    Contrast_scalar(pixels + i * 4, count - i, factor);
}

} // namespace kyv
