// Layer passes with AVX2, eight pixels a step.
#include "effects/pip/LayerRows.h"

#include <immintrin.h>

namespace kyv {
namespace {

inline __m256i Load(const uint8_t* from) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
}

inline void Store(uint8_t* to, __m256i pixels) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), pixels);
}

// All ones in pixels without alpha.
inline __m256i Uncovered(__m256i pixels) {
    return _mm256_cmpeq_epi32(_mm256_srli_epi32(pixels, 24), _mm256_setzero_si256());
}

// -1 in pixels that match. The tolerance has 255 for alpha.
inline __m256i Matches(__m256i pixels, __m256i key, __m256i tolerance) {
    const __m256i distance =
        _mm256_or_si256(_mm256_subs_epu8(pixels, key), _mm256_subs_epu8(key, pixels));
    return _mm256_cmpeq_epi32(_mm256_subs_epu8(distance, tolerance), _mm256_setzero_si256());
}

} // namespace

void ColorKeyRow_avx2(uint8_t* pixels, const uint8_t* below, size_t count, uint32_t key,
                      uint8_t tolerance) {
    const __m256i keys = _mm256_set1_epi32(static_cast<int>(key));
    const __m256i tolerances =
        _mm256_set1_epi32(static_cast<int>(0xFF000000U | tolerance * 0x010101U));
    size_t i = 0;
    // Every step reads one pixel more than it writes.
    for (; i + 9 <= count; i += 8) {
        const __m256i here = Load(pixels + i * 4);
        const __m256i matches =
            _mm256_add_epi32(_mm256_add_epi32(Matches(here, keys, tolerances),
                                              Matches(Load(pixels + i * 4 + 4), keys, tolerances)),
                             _mm256_add_epi32(Matches(Load(below + i * 4), keys, tolerances),
                                              Matches(Load(below + i * 4 + 4), keys, tolerances)));
        // 4 + matches pixels do not match; 64 each, in the top byte. All four are 255.
        const __m256i number = _mm256_add_epi32(matches, _mm256_set1_epi32(4));
        const __m256i all = _mm256_cmpeq_epi32(matches, _mm256_setzero_si256());
        const __m256i alpha =
            _mm256_slli_epi32(_mm256_or_si256(_mm256_slli_epi32(number, 6),
                                              _mm256_and_si256(all, _mm256_set1_epi32(255))),
                              24);
        const __m256i covered =
            _mm256_andnot_si256(Uncovered(here), _mm256_set1_epi32(static_cast<int>(0xFF000000)));
        Store(pixels + i * 4, _mm256_blendv_epi8(here, alpha, covered));
    }
    ColorKeyRow_scalar(pixels + i * 4, below + i * 4, count - i, key, tolerance);
}

} // namespace kyv
