// White balance with SSE2, four pixels a step.
#include "effects/color/WhiteBalanceRow.h"

#include <cstring>

#include <emmintrin.h>

namespace kyv {
namespace {

// A word for each byte of a pixel, for two pixels.
inline __m128i Spread(const uint16_t (&words)[4]) {
    const __m128i pixel = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(words));
    return _mm_unpacklo_epi64(pixel, pixel);
}

// A byte for each byte of a pixel, for four pixels.
inline __m128i Spread(const uint8_t (&bytes)[4]) {
    int pixel;
    memcpy(&pixel, bytes, sizeof pixel);
    return _mm_set1_epi32(pixel);
}

} // namespace

void WhiteBalanceRow_sse2(uint8_t* dst, const uint8_t* src, size_t count,
                          const KneeCurves& curves) {
    size_t i = 0;
    if (curves.exact) {
        const __m128i zero = _mm_setzero_si128();
        const __m128i knee = Spread(curves.knee);
        const __m128i base = Spread(curves.base);
        const __m128i whole = Spread(curves.whole);
        const __m128i fraction = Spread(curves.fraction);
        const __m128i slope = Spread(curves.slope);
        // Words of two pixels: how far each value goes up to the knee, and how far beyond.
        const auto rise = [&](__m128i upTo, __m128i beyond) {
            return _mm_add_epi16(
                _mm_add_epi16(_mm_mullo_epi16(upTo, whole), _mm_mulhi_epu16(upTo, fraction)),
                _mm_mulhi_epu16(beyond, slope));
        };
        for (; i + 4 <= count; i += 4) {
            const __m128i bgra = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * 4));
            const __m128i upTo = _mm_min_epu8(bgra, knee);
            const __m128i beyond = _mm_subs_epu8(bgra, knee);
            const __m128i low =
                rise(_mm_unpacklo_epi8(upTo, zero), _mm_unpacklo_epi8(beyond, zero));
            const __m128i high =
                rise(_mm_unpackhi_epi8(upTo, zero), _mm_unpackhi_epi8(beyond, zero));
            _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4),
                             _mm_add_epi8(_mm_packus_epi16(low, high), base));
        }
    }
    WhiteBalanceRow_scalar(dst + i * 4, src + i * 4, count - i, curves);
}

} // namespace kyv
