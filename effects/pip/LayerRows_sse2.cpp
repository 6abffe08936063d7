// Layer passes with SSE2, four pixels a step.
#include "effects/pip/LayerRows.h"

#include <emmintrin.h>

namespace kyv {
namespace {

inline __m128i Load(const uint8_t* from) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

inline void Store(uint8_t* to, __m128i pixels) {
    _mm_storeu_si128(reinterpret_cast<__m128i*>(to), pixels);
}

// All ones in pixels without alpha.
inline __m128i Uncovered(__m128i pixels) {
    return _mm_cmpeq_epi32(_mm_srli_epi32(pixels, 24), _mm_setzero_si128());
}

// -1 in pixels that match. The tolerance has 255 for alpha.
inline __m128i Matches(__m128i pixels, __m128i key, __m128i tolerance) {
    const __m128i distance = _mm_or_si128(_mm_subs_epu8(pixels, key), _mm_subs_epu8(key, pixels));
    return _mm_cmpeq_epi32(_mm_subs_epu8(distance, tolerance), _mm_setzero_si128());
}

} // namespace

void ColorKeyRow_sse2(uint8_t* pixels, const uint8_t* below, size_t count, uint32_t key,
                      uint8_t tolerance) {
    const __m128i keys = _mm_set1_epi32(static_cast<int>(key));
    const __m128i tolerances =
        _mm_set1_epi32(static_cast<int>(0xFF000000U | tolerance * 0x010101U));
    size_t i = 0;
    // Every step reads one pixel more than it writes.
    for (; i + 5 <= count; i += 4) {
        const __m128i here = Load(pixels + i * 4);
        const __m128i matches =
            _mm_add_epi32(_mm_add_epi32(Matches(here, keys, tolerances),
                                        Matches(Load(pixels + i * 4 + 4), keys, tolerances)),
                          _mm_add_epi32(Matches(Load(below + i * 4), keys, tolerances),
                                        Matches(Load(below + i * 4 + 4), keys, tolerances)));
        // 4 + matches pixels do not match; 64 each, in the top byte. All four are 255.
        const __m128i number = _mm_add_epi32(matches, _mm_set1_epi32(4));
        const __m128i all = _mm_cmpeq_epi32(matches, _mm_setzero_si128());
        const __m128i alpha = _mm_slli_epi32(
            _mm_or_si128(_mm_slli_epi32(number, 6), _mm_and_si128(all, _mm_set1_epi32(255))), 24);
        const __m128i covered =
            _mm_andnot_si128(Uncovered(here), _mm_set1_epi32(static_cast<int>(0xFF000000)));
        Store(pixels + i * 4,
              _mm_or_si128(_mm_andnot_si128(covered, here), _mm_and_si128(covered, alpha)));
    }
    ColorKeyRow_scalar(pixels + i * 4, below + i * 4, count - i, key, tolerance);
}

void GradientRow_sse2(uint8_t* pixels, const float* top, const float* rise, size_t count,
                      float part) {
    const __m128 parts = _mm_set1_ps(part);
    const auto blend = [&](size_t i) {
        const __m128 value =
            _mm_add_ps(_mm_loadu_ps(top + i * 4), _mm_mul_ps(_mm_loadu_ps(rise + i * 4), parts));
        return _mm_cvttps_epi32(
            _mm_max_ps(_mm_min_ps(value, _mm_set1_ps(255.0F)), _mm_setzero_ps()));
    };
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i old = Load(pixels + i * 4);
        const __m128i keep =
            _mm_or_si128(Uncovered(old), _mm_set1_epi32(static_cast<int>(0xFF000000)));
        const __m128i colors = _mm_packus_epi16(_mm_packs_epi32(blend(i), blend(i + 1)),
                                                _mm_packs_epi32(blend(i + 2), blend(i + 3)));
        Store(pixels + i * 4,
              _mm_or_si128(_mm_and_si128(keep, old), _mm_andnot_si128(keep, colors)));
    }
    GradientRow_scalar(pixels + i * 4, top + i * 4, rise + i * 4, count - i, part);
}

} // namespace kyv
