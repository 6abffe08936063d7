// Colour temperature with SSE2, four pixels a step.
#include "effects/color/ColorTemperatureRow.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m128i Factors(int low, int high) {
    return _mm_set1_epi32(high << 16 | low);
}

// A word for each byte of a pixel, for two pixels.
inline __m128i Spread(const uint16_t (&words)[4]) {
    const __m128i pixel = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(words));
    return _mm_unpacklo_epi64(pixel, pixel);
}

// The curves of one stage in registers.
struct Stage {
    __m128i whole;
    __m128i fraction;
    __m128i exception[GainCurves::kMaxExceptions];
    uint32_t exceptionCount;
};

inline Stage Load(const GainCurves& curves) {
    Stage stage = {Spread(curves.whole), Spread(curves.fraction), {}, curves.exceptionCount};
    for (uint32_t i = 0; i < curves.exceptionCount; ++i) {
        stage.exception[i] = Spread(curves.exception[i]);
    }
    return stage;
}

// Two pixels of words through the curves.
inline __m128i Apply(const Stage& stage, __m128i words) {
    __m128i result =
        _mm_add_epi16(_mm_mullo_epi16(words, stage.whole), _mm_mulhi_epu16(words, stage.fraction));
    result = _mm_min_epi16(result, _mm_set1_epi16(255));
    for (uint32_t i = 0; i < stage.exceptionCount; ++i) {
        result = _mm_add_epi16(result, _mm_cmpeq_epi16(words, stage.exception[i]));
    }
    return result;
}

// (corrected * w + kept * (55 - w)) / 55; 19066 / 2^20 divides exactly up to 55 * 255.
inline __m128i Blend(__m128i corrected, __m128i kept, __m128i w) {
    const __m128i rest = _mm_sub_epi16(_mm_set1_epi16(55), w);
    const __m128i sum = _mm_add_epi16(_mm_mullo_epi16(corrected, w), _mm_mullo_epi16(kept, rest));
    return _mm_srli_epi16(_mm_mulhi_epu16(sum, _mm_set1_epi16(19066)), 4);
}

inline __m128i ApplyToHighlights(const Stage& stage, __m128i words, __m128i w) {
    return Blend(Apply(stage, words), words, w);
}

// 4096 times the luma of four pixels. The constant rides on a word of 64 beside green.
inline __m128i Luma(__m128i bgra) {
    const __m128i br = _mm_and_si128(bgra, _mm_set1_epi32(0x00FF00FF));
    const __m128i gc = _mm_or_si128(_mm_and_si128(_mm_srli_epi32(bgra, 8), _mm_set1_epi32(0xFF)),
                                    _mm_set1_epi32(64 << 16));
    return _mm_add_epi32(_mm_madd_epi16(br, Factors(401, 1053)),
                         _mm_madd_epi16(gc, Factors(2064, 1056)));
}

} // namespace

void ColorTemperatureRow_sse2(uint8_t* dst, const uint8_t* src, size_t count,
                              const GainCurves& first, const GainCurves& second) {
    size_t i = 0;
    if (first.exact && second.exact) {
        const Stage one = Load(first);
        const Stage two = Load(second);
        for (; i + 4 <= count; i += 4) {
            const __m128i bgra = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
            const __m128i luma = Luma(bgra);
            __m128i low = _mm_unpacklo_epi8(bgra, _mm_setzero_si128());
            __m128i high = _mm_unpackhi_epi8(bgra, _mm_setzero_si128());
            const __m128i bright = _mm_cmpgt_epi32(luma, _mm_set1_epi32((200 << 12) - 1));
            if (_mm_movemask_epi8(bright) == 0) {
                low = Apply(two, Apply(one, low));
                high = Apply(two, Apply(one, high));
            } else {
                // The weight of the correction, 55 for all but highlights; then once a channel.
                __m128i w = _mm_sub_epi32(_mm_set1_epi32(255), _mm_srli_epi32(luma, 12));
                w = _mm_min_epi16(w, _mm_set1_epi32(55));
                w = _mm_or_si128(w, _mm_slli_epi32(w, 16));
                const __m128i lowW = _mm_unpacklo_epi32(w, w);
                const __m128i highW = _mm_unpackhi_epi32(w, w);
                low = ApplyToHighlights(two, ApplyToHighlights(one, low, lowW), lowW);
                high = ApplyToHighlights(two, ApplyToHighlights(one, high, highW), highW);
            }
            _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), _mm_packus_epi16(low, high));
        }
    }
    ColorTemperatureRow_scalar(dst + i * 4, src + i * 4, count - i, first, second);
}

} // namespace kyv
