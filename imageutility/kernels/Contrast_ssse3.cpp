// Contrast with SSSE3, four pixels a step.
#include "imageutility/kernels/Contrast.h"

#include <tmmintrin.h>

namespace kyv {
namespace {

// Eight words x - 128 in 1/256 become (x - 128) * factor, rounded: 8 * factor / 32768 is
// factor / 4096.
inline __m128i Scale(__m128i centered, __m128i factors) {
    return _mm_mulhrs_epi16(_mm_srai_epi16(centered, 5), factors);
}

} // namespace

void Contrast_ssse3(uint8_t* pixels, size_t count, int32_t factor) {
    // A factor of 1 keeps alpha.
    const auto k = static_cast<short>(factor);
    const __m128i factors = _mm_setr_epi16(k, k, k, 4096, k, k, k, 4096);
    const __m128i center = _mm_set1_epi8(-128);
    const __m128i zero = _mm_setzero_si128();
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(pixels + i * 4);
        const __m128i x = _mm_xor_si128(_mm_loadu_si128(out), center);
        const __m128i low = Scale(_mm_unpacklo_epi8(zero, x), factors);
        const __m128i high = Scale(_mm_unpackhi_epi8(zero, x), factors);
        _mm_storeu_si128(out, _mm_xor_si128(_mm_packs_epi16(low, high), center));
    }
    Contrast_scalar(pixels + i * 4, count - i, factor);
}

} // namespace kyv
