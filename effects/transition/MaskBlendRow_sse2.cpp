// Mask blend with SSE2, sixteen pixels a step.
#include "effects/transition/MaskBlendRow.h"

#include <emmintrin.h>

namespace kyv {
namespace {

inline __m128i Load(const uint8_t* bytes) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
}

inline void Store(uint8_t* bytes, __m128i value) {
    _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes), value);
}

// The factors of two pixels.
inline __m128i Lookup(const uint16_t (*table)[4], const uint8_t* mask) {
    return _mm_unpacklo_epi64(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(table[mask[0]])),
                              _mm_loadl_epi64(reinterpret_cast<const __m128i*>(table[mask[1]])));
}

// Two pixels in 16-bit lanes. p1 * w + p0 * (255 - w) is at most 255 * 255, so
// 256 * p0 + (p1 - p0) * w - p0 is right in 16 bits whatever overflows on the way; without the
// last term a weight of 0 or 256 gives p0 or p1. *isMixed is set in the lanes of other weights.
inline __m128i Mix(__m128i p0, __m128i p1, __m128i w, __m128i* isMixed) {
    const __m128i isPure =
        _mm_cmpeq_epi16(_mm_and_si128(w, _mm_set1_epi16(0x00FF)), _mm_setzero_si128());
    *isMixed = _mm_xor_si128(isPure, _mm_set1_epi16(-1));
    const __m128i sum =
        _mm_add_epi16(_mm_slli_epi16(p0, 8), _mm_mullo_epi16(_mm_sub_epi16(p1, p0), w));
    return _mm_srli_epi16(_mm_sub_epi16(sum, _mm_andnot_si128(isPure, p0)), 8);
}

// At most 255 * 256 + 0 or 255 * 255: 16 bits hold it.
inline __m128i Tint(__m128i x, __m128i keep, __m128i edge) {
    return _mm_srli_epi16(_mm_add_epi16(_mm_mullo_epi16(x, keep), edge), 8);
}

inline void BlendFour(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                      const uint8_t* mask, const MaskBlend& blend) {
    const __m128i zero = _mm_setzero_si128();
    const __m128i p0 = Load(picture0);
    const __m128i p1 = Load(picture1);
    __m128i isMixedLow, isMixedHigh;
    __m128i low = Mix(_mm_unpacklo_epi8(p0, zero), _mm_unpacklo_epi8(p1, zero),
                      Lookup(blend.weight, mask), &isMixedLow);
    __m128i high = Mix(_mm_unpackhi_epi8(p0, zero), _mm_unpackhi_epi8(p1, zero),
                       Lookup(blend.weight, mask + 2), &isMixedHigh);
    if (blend.hasEdge) {
        low = Tint(low, Lookup(blend.keep, mask), Lookup(blend.edge, mask));
        high = Tint(high, Lookup(blend.keep, mask + 2), Lookup(blend.edge, mask + 2));
    }
    const __m128i x = _mm_packus_epi16(low, high);
    const __m128i alphas = _mm_and_si128(_mm_packs_epi16(isMixedLow, isMixedHigh),
                                         _mm_set1_epi32(static_cast<int>(0xFF000000)));
    const __m128i greater = _mm_max_epu8(p0, p1);
    Store(dst, _mm_or_si128(_mm_andnot_si128(alphas, x), _mm_and_si128(alphas, greater)));
}

inline void CopySixteen(uint8_t* dst, const uint8_t* src) {
    for (int i = 0; i < 64; i += 16) {
        Store(dst + i, Load(src + i));
    }
}

} // namespace

void MaskBlendRow_sse2(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                       const uint8_t* mask, size_t count, const MaskBlend& blend) {
    // Bounds that no byte reaches are compared as 255 or 0 and then not counted.
    const int allow0 = blend.picture0From <= 255 ? 0xFFFF : 0;
    const int allow1 = blend.picture1UpTo >= 0 ? 0xFFFF : 0;
    const __m128i from = _mm_set1_epi8(static_cast<char>(allow0 ? blend.picture0From : 255));
    const __m128i upTo = _mm_set1_epi8(static_cast<char>(allow1 ? blend.picture1UpTo : 0));
    size_t i = 0;
    for (; i + 16 <= count; i += 16) {
        const __m128i m = Load(mask + i);
        const size_t at = i * 4;
        if ((_mm_movemask_epi8(_mm_cmpeq_epi8(_mm_max_epu8(m, from), m)) & allow0) == 0xFFFF) {
            CopySixteen(dst + at, picture0 + at);
        } else if ((_mm_movemask_epi8(_mm_cmpeq_epi8(_mm_min_epu8(m, upTo), m)) & allow1) ==
                   0xFFFF) {
            CopySixteen(dst + at, picture1 + at);
        } else {
            for (size_t j = 0; j < 16; j += 4) {
                BlendFour(dst + at + j * 4, picture0 + at + j * 4, picture1 + at + j * 4,
                          mask + i + j, blend);
            }
        }
    }
    MaskBlendRow_scalar(dst + i * 4, picture0 + i * 4, picture1 + i * 4, mask + i, count - i,
                        blend);
}

} // namespace kyv
