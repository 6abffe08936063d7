// Thirty-two bytes a step.
#include <immintrin.h>

#include "effects/style/ShrinkRow.h"

namespace kyv {

void AddRow_avx2(uint16_t* sums, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 32 <= count; i += 32) {
        for (size_t half = 0; half < 32; half += 16) {
            const __m256i words = _mm256_cvtepu8_epi16(
                _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i + half)));
            __m256i* at = reinterpret_cast<__m256i*>(sums + i + half);
            _mm256_storeu_si256(at, _mm256_add_epi16(_mm256_loadu_si256(at), words));
        }
    }
    AddRow_scalar(sums + i, src + i, count - i);
}

} // namespace kyv
