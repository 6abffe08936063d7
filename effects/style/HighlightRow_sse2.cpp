// Four pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/HighlightRow.h"
#include "effects/style/StyleVector_sse2.h"

namespace kyv {

void HighlightRow_sse2(uint8_t* dst, const uint8_t* src, size_t count, const Highlight& highlight) {
    const __m128i byte = _mm_set1_epi32(255);
    const __m128i floor = _mm_set1_epi32(highlight.floor);
    const __m128i slope = _mm_set1_epi32(highlight.slope);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i pixels = Load(src + i * 4);
        const Words words = Widen(pixels);
        const __m128i strongest =
            _mm_and_si128(_mm_max_epu8(_mm_max_epu8(pixels, _mm_srli_epi32(pixels, 8)),
                                       _mm_srli_epi32(pixels, 16)),
                          byte);
        // All in doublewords whose upper halves stay 0.
        const __m128i above = _mm_subs_epu16(_mm_avg_epu16(Luma(words), strongest), floor);
        const __m128i rise = _mm_srli_epi16(_mm_mullo_epi16(above, slope), 4);
        const __m128i weight = _mm_min_epi16(rise, byte);
        const __m128i t = _mm_add_epi32(_mm_mullo_epi16(weight, weight), _mm_set1_epi32(128));
        const __m128i square = _mm_srli_epi32(_mm_add_epi32(t, _mm_srli_epi32(t, 8)), 8);
        const Words weights = Spread(square);
        const __m128i result =
            Narrow(Product(words.low, weights.low), Product(words.high, weights.high));
        Store(dst + i * 4, WithAlphaOf(_mm_setzero_si128(), result));
    }
    HighlightRow_scalar(dst + i * 4, src + i * 4, count - i, highlight);
}

} // namespace kyv
