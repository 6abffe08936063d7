// Masked fill with AVX2, eight pixels a step.
#include "imageutility/kernels/FillMasked.h"

#include <immintrin.h>

namespace kyv {

void FillMasked_avx2(uint8_t* pixels, size_t count, uint32_t keep, uint32_t value) {
    const __m256i kept = _mm256_set1_epi32(static_cast<int>(keep));
    const __m256i filled = _mm256_set1_epi32(static_cast<int>(value));
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        auto* out = reinterpret_cast<__m256i*>(pixels + i * 4);
        const __m256i rest = _mm256_and_si256(_mm256_loadu_si256(out), kept);
        _mm256_storeu_si256(out, _mm256_or_si256(rest, filled));
    }
    FillMasked_scalar(pixels + i * 4, count - i, keep, value);
}

} // namespace kyv
