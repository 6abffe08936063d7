// Bilinear resizing with SSE2, four pixels a step.
#include "imageutility/kernels/Bilinear.h"

#include <emmintrin.h>

namespace kyv {
namespace {

inline __m128i Between(__m128i a, __m128i b, __m128i fractions) {
    return _mm_add_epi16(a, _mm_srai_epi16(_mm_mullo_epi16(_mm_sub_epi16(b, a), fractions), 7));
}

// Two pixels, 16 bits a channel.
inline __m128i Interpolate(const uint8_t* src, const int32_t* left, __m128i fractions) {
    const auto* first = reinterpret_cast<const __m128i*>(src + static_cast<ptrdiff_t>(left[0]) * 4);
    const auto* second =
        reinterpret_cast<const __m128i*>(src + static_cast<ptrdiff_t>(left[1]) * 4);
    // The left pixels lie in the low half, the right ones in the high half.
    const __m128i pixels = _mm_unpacklo_epi32(_mm_loadl_epi64(first), _mm_loadl_epi64(second));
    const __m128i zero = _mm_setzero_si128();
    return Between(_mm_unpacklo_epi8(pixels, zero), _mm_unpackhi_epi8(pixels, zero), fractions);
}

} // namespace

void Bilinear_sse2(uint8_t* dst, const uint8_t* src, size_t count, const BilinearColumns& columns) {
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        // The fraction is the second of two weights.
        const __m128i f = _mm_srli_epi16(
            _mm_loadl_epi64(reinterpret_cast<const __m128i*>(columns.weights + 2 * i)), 8);
        const __m128i twice = _mm_unpacklo_epi16(f, f);
        const __m128i first = Interpolate(src, columns.left + i, _mm_unpacklo_epi32(twice, twice));
        const __m128i second =
            Interpolate(src, columns.left + i + 2, _mm_unpackhi_epi32(twice, twice));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), _mm_packus_epi16(first, second));
    }
    Bilinear_scalar(dst + i * 4, src, count - i, {columns.left + i, columns.weights + 2 * i});
}

void Lerp_sse2(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
               uint32_t fraction) {
    const __m128i fractions = _mm_set1_epi16(static_cast<short>(fraction));
    const __m128i zero = _mm_setzero_si128();
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i a = _mm_loadu_si128(reinterpret_cast<const __m128i*>(upper + i * 4));
        const __m128i b = _mm_loadu_si128(reinterpret_cast<const __m128i*>(lower + i * 4));
        const __m128i low =
            Between(_mm_unpacklo_epi8(a, zero), _mm_unpacklo_epi8(b, zero), fractions);
        const __m128i high =
            Between(_mm_unpackhi_epi8(a, zero), _mm_unpackhi_epi8(b, zero), fractions);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), _mm_packus_epi16(low, high));
    }
    Lerp_scalar(dst + i * 4, upper + i * 4, lower + i * 4, count - i, fraction);
}

} // namespace kyv
