// Colour temperature with AVX2, eight pixels a step.
#include "effects/color/ColorTemperatureRow.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m256i Factors(int low, int high) {
    return _mm256_set1_epi32(high << 16 | low);
}

// A word for each byte of a pixel, for four pixels.
inline __m256i Spread(const uint16_t (&words)[4]) {
    return _mm256_broadcastq_epi64(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(words)));
}

// The curves of one stage in registers.
struct Stage {
    __m256i whole;
    __m256i fraction;
    __m256i exception[GainCurves::kMaxExceptions];
    uint32_t exceptionCount;
};

inline Stage Load(const GainCurves& curves) {
    Stage stage = {Spread(curves.whole), Spread(curves.fraction), {}, curves.exceptionCount};
    for (uint32_t i = 0; i < curves.exceptionCount; ++i) {
        stage.exception[i] = Spread(curves.exception[i]);
    }
    return stage;
}

// Four pixels of words through the curves.
inline __m256i Apply(const Stage& stage, __m256i words) {
    __m256i result = _mm256_add_epi16(_mm256_mullo_epi16(words, stage.whole),
                                      _mm256_mulhi_epu16(words, stage.fraction));
    result = _mm256_min_epi16(result, _mm256_set1_epi16(255));
    for (uint32_t i = 0; i < stage.exceptionCount; ++i) {
        result = _mm256_add_epi16(result, _mm256_cmpeq_epi16(words, stage.exception[i]));
    }
    return result;
}

// (corrected * w + kept * (55 - w)) / 55; 19066 / 2^20 divides exactly up to 55 * 255.
inline __m256i Blend(__m256i corrected, __m256i kept, __m256i w) {
    const __m256i rest = _mm256_sub_epi16(_mm256_set1_epi16(55), w);
    const __m256i sum =
        _mm256_add_epi16(_mm256_mullo_epi16(corrected, w), _mm256_mullo_epi16(kept, rest));
    return _mm256_srli_epi16(_mm256_mulhi_epu16(sum, _mm256_set1_epi16(19066)), 4);
}

inline __m256i ApplyToHighlights(const Stage& stage, __m256i words, __m256i w) {
    return Blend(Apply(stage, words), words, w);
}

// 4096 times the luma of eight pixels. The constant rides on a word of 64 beside green.
inline __m256i Luma(__m256i bgra) {
    constexpr int kOddWords = 0xAA;
    const __m256i br = _mm256_and_si256(bgra, _mm256_set1_epi32(0x00FF00FF));
    const __m256i gc =
        _mm256_blend_epi16(_mm256_srli_epi16(bgra, 8), _mm256_set1_epi16(64), kOddWords);
    return _mm256_add_epi32(_mm256_madd_epi16(br, Factors(401, 1053)),
                            _mm256_madd_epi16(gc, Factors(2064, 1056)));
}

} // namespace

void ColorTemperatureRow_avx2(uint8_t* dst, const uint8_t* src, size_t count,
                              const GainCurves& first, const GainCurves& second) {
    size_t i = 0;
    if (first.exact && second.exact) {
        const Stage one = Load(first);
        const Stage two = Load(second);
        for (; i + 8 <= count; i += 8) {
            const __m256i bgra = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
            const __m256i luma = Luma(bgra);
            __m256i low = _mm256_unpacklo_epi8(bgra, _mm256_setzero_si256());
            __m256i high = _mm256_unpackhi_epi8(bgra, _mm256_setzero_si256());
            const __m256i bright = _mm256_cmpgt_epi32(luma, _mm256_set1_epi32((200 << 12) - 1));
            if (_mm256_testz_si256(bright, bright)) {
                low = Apply(two, Apply(one, low));
                high = Apply(two, Apply(one, high));
            } else {
                // The weight of the correction, 55 for all but highlights; then once a channel.
                __m256i w = _mm256_sub_epi32(_mm256_set1_epi32(255), _mm256_srli_epi32(luma, 12));
                w = _mm256_min_epi16(w, _mm256_set1_epi32(55));
                w = _mm256_or_si256(w, _mm256_slli_epi32(w, 16));
                const __m256i lowW = _mm256_unpacklo_epi32(w, w);
                const __m256i highW = _mm256_unpackhi_epi32(w, w);
                low = ApplyToHighlights(two, ApplyToHighlights(one, low, lowW), lowW);
                high = ApplyToHighlights(two, ApplyToHighlights(one, high, highW), highW);
            }
            _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i * 4),
                                _mm256_packus_epi16(low, high));
        }
    }
    ColorTemperatureRow_scalar(dst + i * 4, src + i * 4, count - i, first, second);
}

} // namespace kyv
