// White balance with AVX2, eight pixels a step.
#include "effects/color/WhiteBalanceRow.h"

#include <cstring>

#include <immintrin.h>

namespace kyv {
namespace {

// A word for each byte of a pixel, for four pixels.
inline __m256i Spread(const uint16_t (&words)[4]) {
    return _mm256_broadcastq_epi64(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(words)));
}

// A byte for each byte of a pixel, for eight pixels.
inline __m256i Spread(const uint8_t (&bytes)[4]) {
    int pixel;
    memcpy(&pixel, bytes, sizeof pixel);
    return _mm256_set1_epi32(pixel);
}

} // namespace

void WhiteBalanceRow_avx2(uint8_t* dst, const uint8_t* src, size_t count,
                          const KneeCurves& curves) {
    size_t i = 0;
    if (curves.exact) {
        const __m256i zero = _mm256_setzero_si256();
        const __m256i knee = Spread(curves.knee);
        const __m256i base = Spread(curves.base);
        const __m256i whole = Spread(curves.whole);
        const __m256i fraction = Spread(curves.fraction);
        const __m256i slope = Spread(curves.slope);
        // Words of four pixels: how far each value goes up to the knee, and how far beyond.
        const auto rise = [&](__m256i upTo, __m256i beyond) {
            return _mm256_add_epi16(_mm256_add_epi16(_mm256_mullo_epi16(upTo, whole),
                                                     _mm256_mulhi_epu16(upTo, fraction)),
                                    _mm256_mulhi_epu16(beyond, slope));
        };
        for (; i + 8 <= count; i += 8) {
            const __m256i bgra = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
            const __m256i upTo = _mm256_min_epu8(bgra, knee);
            const __m256i beyond = _mm256_subs_epu8(bgra, knee);
            const __m256i low =
                rise(_mm256_unpacklo_epi8(upTo, zero), _mm256_unpacklo_epi8(beyond, zero));
            const __m256i high =
                rise(_mm256_unpackhi_epi8(upTo, zero), _mm256_unpackhi_epi8(beyond, zero));
            _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i * 4),
                                _mm256_add_epi8(_mm256_packus_epi16(low, high), base));
        }
    }
    WhiteBalanceRow_scalar(dst + i * 4, src + i * 4, count - i, curves);
}

} // namespace kyv
