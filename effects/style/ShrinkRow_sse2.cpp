// Sixteen bytes a step when adding, one pixel of sums a step when averaging.
#include <emmintrin.h>

#include "effects/style/ShrinkRow.h"

namespace kyv {

void AddRow_sse2(uint16_t* sums, const uint8_t* src, size_t count) {
    const __m128i zero = _mm_setzero_si128();
    size_t i = 0;
    for (; i + 16 <= count; i += 16) {
        const __m128i bytes = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i));
        __m128i* low = reinterpret_cast<__m128i*>(sums + i);
        __m128i* high = reinterpret_cast<__m128i*>(sums + i + 8);
        _mm_storeu_si128(low, _mm_add_epi16(_mm_loadu_si128(low), _mm_unpacklo_epi8(bytes, zero)));
        _mm_storeu_si128(high,
                         _mm_add_epi16(_mm_loadu_si128(high), _mm_unpackhi_epi8(bytes, zero)));
    }
    AddRow_scalar(sums + i, src + i, count - i);
}

void AverageRow_sse2(uint8_t* dst, const uint16_t* sums, size_t count, int32_t bits) {
    const __m128i zero = _mm_setzero_si128();
    const __m128i half = _mm_set1_epi32((1 << (2 * bits)) >> 1);
    const __m128i shift = _mm_cvtsi32_si128(2 * bits);
    const size_t side = size_t{1} << bits;
    for (size_t i = 0; i < count; ++i) {
        // The half on top of 65280 still fits 16 bits, but the sum is wanted below 32768 nowhere:
        // it is widened before the shift.
        __m128i sum = zero;
        const uint16_t* first = sums + (i << bits) * 4;
        for (size_t k = 0; k < side; ++k) {
            sum = _mm_add_epi16(sum,
                                _mm_loadl_epi64(reinterpret_cast<const __m128i*>(first + k * 4)));
        }
        const __m128i wide = _mm_unpacklo_epi16(sum, zero);
        const __m128i average = _mm_srl_epi32(_mm_add_epi32(wide, half), shift);
        const __m128i words = _mm_packs_epi32(average, average);
        const int32_t pixel = _mm_cvtsi128_si32(_mm_packus_epi16(words, words));
        __builtin_memcpy(dst + i * 4, &pixel, 4);
    }
}

} // namespace kyv
