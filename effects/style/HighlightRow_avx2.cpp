// Eight pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/HighlightRow.h"
#include "effects/style/StyleVector_avx2.h"

namespace kyv {

void HighlightRow_avx2(uint8_t* dst, const uint8_t* src, size_t count, const Highlight& highlight) {
    const __m256i byte = _mm256_set1_epi32(255);
    const __m256i floor = _mm256_set1_epi32(highlight.floor);
    const __m256i slope = _mm256_set1_epi32(highlight.slope);
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i pixels = Load(src + i * 4);
        const Words words = Widen(pixels);
        const __m256i strongest =
            _mm256_and_si256(_mm256_max_epu8(_mm256_max_epu8(pixels, _mm256_srli_epi32(pixels, 8)),
                                             _mm256_srli_epi32(pixels, 16)),
                             byte);
        // All in doublewords whose upper halves stay 0.
        const __m256i above = _mm256_subs_epu16(_mm256_avg_epu16(Luma(words), strongest), floor);
        const __m256i rise = _mm256_srli_epi16(_mm256_mullo_epi16(above, slope), 4);
        const __m256i weight = _mm256_min_epi16(rise, byte);
        const __m256i t =
            _mm256_add_epi32(_mm256_mullo_epi16(weight, weight), _mm256_set1_epi32(128));
        const __m256i square = _mm256_srli_epi32(_mm256_add_epi32(t, _mm256_srli_epi32(t, 8)), 8);
        const Words weights = Spread(square);
        const __m256i result =
            Narrow(Product(words.low, weights.low), Product(words.high, weights.high));
        Store(dst + i * 4, WithAlphaOf(_mm256_setzero_si256(), result));
    }
    HighlightRow_scalar(dst + i * 4, src + i * 4, count - i, highlight);
}

} // namespace kyv
