// Masked fill with SSE2, four pixels a step.
#include "imageutility/kernels/FillMasked.h"

#include <emmintrin.h>

namespace kyv {

void FillMasked_sse2(uint8_t* pixels, size_t count, uint32_t keep, uint32_t value) {
    const __m128i kept = _mm_set1_epi32(static_cast<int>(keep));
    const __m128i filled = _mm_set1_epi32(static_cast<int>(value));
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        auto* out = reinterpret_cast<__m128i*>(pixels + i * 4);
        const __m128i rest = _mm_and_si128(_mm_loadu_si128(out), kept);
        _mm_storeu_si128(out, _mm_or_si128(rest, filled));
    }
    FillMasked_scalar(pixels + i * 4, count - i, keep, value);
}

} // namespace kyv
