// Bilinear reading through map entries with SSE2, four pixels a step.
#include "effects/pip/QuadSampleRow.h"

#include <emmintrin.h>

namespace kyv {
namespace {

// A pixel and its right neighbour.
inline __m128i LoadPair(const uint8_t* from) {
    return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(from));
}

// Two pixels of a source row, 16 bits a channel; fraction is below 2^15, so that the high half of
// the product is the difference's part, rounded down.
inline __m128i Across(const uint8_t* first, const uint8_t* second, __m128i fraction) {
    const __m128i pairs = _mm_unpacklo_epi32(LoadPair(first), LoadPair(second));
    const __m128i left = _mm_unpacklo_epi8(pairs, _mm_setzero_si128());
    const __m128i right = _mm_unpackhi_epi8(pairs, _mm_setzero_si128());
    return _mm_add_epi16(left, _mm_mulhi_epi16(fraction, _mm_sub_epi16(right, left)));
}

inline __m128i TwoPixels(const uint8_t* first, const uint8_t* second, ptrdiff_t pitch, __m128i fu,
                         __m128i fv) {
    const __m128i top = Across(first, second, fu);
    const __m128i bottom = Across(first + pitch, second + pitch, fu);
    return _mm_add_epi16(top, _mm_mulhi_epi16(fv, _mm_sub_epi16(bottom, top)));
}

} // namespace

void QuadSampleRow_sse2(uint8_t* dst, const uint32_t* map, size_t count,
                        const SamplePicture& picture) {
    // Entries reach no further than column and row 1023.
    const int right = picture.width - 1 < 1024 ? picture.width - 1 : 1024;
    const int lower = picture.height - 1 < 1024 ? picture.height - 1 : 1024;
    const __m128i limit = _mm_set1_epi32(static_cast<int>(static_cast<unsigned>(lower) << 16 |
                                                          (static_cast<unsigned>(right) & 0xFFFF)));
    const __m128i lowWords = _mm_set1_epi32(0xFFFF);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i entries = _mm_loadu_si128(reinterpret_cast<const __m128i*>(map + i));
        const __m128i whole = _mm_srli_epi16(entries, 6);
        if (_mm_movemask_epi8(_mm_cmpgt_epi16(limit, whole)) != 0xFFFF) {
            QuadSampleRow_scalar(dst + i * 4, map + i, 4, picture);
            continue;
        }
        const uint8_t* at[4];
        for (int k = 0; k < 4; ++k) {
            const uint32_t entry = map[i + static_cast<size_t>(k)];
            at[k] = picture.pixels + static_cast<ptrdiff_t>(entry >> 22) * picture.pitch +
                    ptrdiff_t{4} * static_cast<ptrdiff_t>(entry >> 6 & 1023);
        }
        // Half the fraction in 1/65536, in both words of a pixel.
        const __m128i half = _mm_slli_epi16(_mm_and_si128(entries, _mm_set1_epi16(63)), 9);
        const __m128i fu = _mm_or_si128(_mm_and_si128(half, lowWords), _mm_slli_epi32(half, 16));
        const __m128i fv = _mm_or_si128(_mm_andnot_si128(lowWords, half), _mm_srli_epi32(half, 16));
        const __m128i low = TwoPixels(at[0], at[1], picture.pitch, _mm_unpacklo_epi32(fu, fu),
                                      _mm_unpacklo_epi32(fv, fv));
        const __m128i high = TwoPixels(at[2], at[3], picture.pitch, _mm_unpackhi_epi32(fu, fu),
                                       _mm_unpackhi_epi32(fv, fv));
        const __m128i pixels =
            _mm_or_si128(_mm_packus_epi16(low, high), _mm_set1_epi32(static_cast<int>(0xFF000000)));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), pixels);
    }
    QuadSampleRow_scalar(dst + i * 4, map + i, count - i, picture);
}

} // namespace kyv
