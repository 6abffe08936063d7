// Mask blend with AVX2, thirty-two pixels a step.
#include "effects/transition/MaskBlendRow.h"

#include <immintrin.h>

namespace kyv {
namespace {

inline __m256i Load(const uint8_t* bytes) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(bytes));
}

inline void Store(uint8_t* bytes, __m256i value) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(bytes), value);
}

inline __m128i LookupTwo(const uint16_t (*table)[4], const uint8_t* mask) {
    return _mm_unpacklo_epi64(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(table[mask[0]])),
                              _mm_loadl_epi64(reinterpret_cast<const __m128i*>(table[mask[1]])));
}

// The factors of four pixels in the order that unpacking gives them: 0, 1, 4 and 5 from the first.
inline __m256i Lookup(const uint16_t (*table)[4], const uint8_t* mask) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(LookupTwo(table, mask)),
                                   LookupTwo(table, mask + 4), 1);
}

// Four pixels in 16-bit lanes; the SSE2 form tells why 16 bits are enough.
inline __m256i Mix(__m256i p0, __m256i p1, __m256i w, __m256i* isMixed) {
    const __m256i isPure =
        _mm256_cmpeq_epi16(_mm256_and_si256(w, _mm256_set1_epi16(0x00FF)), _mm256_setzero_si256());
    *isMixed = _mm256_xor_si256(isPure, _mm256_set1_epi16(-1));
    const __m256i sum =
        _mm256_add_epi16(_mm256_slli_epi16(p0, 8), _mm256_mullo_epi16(_mm256_sub_epi16(p1, p0), w));
    return _mm256_srli_epi16(_mm256_sub_epi16(sum, _mm256_andnot_si256(isPure, p0)), 8);
}

inline __m256i Tint(__m256i x, __m256i keep, __m256i edge) {
    return _mm256_srli_epi16(_mm256_add_epi16(_mm256_mullo_epi16(x, keep), edge), 8);
}

inline void BlendEight(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                       const uint8_t* mask, const MaskBlend& blend) {
    const __m256i zero = _mm256_setzero_si256();
    const __m256i p0 = Load(picture0);
    const __m256i p1 = Load(picture1);
    __m256i isMixedLow, isMixedHigh;
    __m256i low = Mix(_mm256_unpacklo_epi8(p0, zero), _mm256_unpacklo_epi8(p1, zero),
                      Lookup(blend.weight, mask), &isMixedLow);
    __m256i high = Mix(_mm256_unpackhi_epi8(p0, zero), _mm256_unpackhi_epi8(p1, zero),
                       Lookup(blend.weight, mask + 2), &isMixedHigh);
    if (blend.hasEdge) {
        low = Tint(low, Lookup(blend.keep, mask), Lookup(blend.edge, mask));
        high = Tint(high, Lookup(blend.keep, mask + 2), Lookup(blend.edge, mask + 2));
    }
    const __m256i x = _mm256_packus_epi16(low, high);
    const __m256i alphas = _mm256_and_si256(_mm256_packs_epi16(isMixedLow, isMixedHigh),
                                            _mm256_set1_epi32(static_cast<int>(0xFF000000)));
    Store(dst, _mm256_blendv_epi8(x, _mm256_max_epu8(p0, p1), alphas));
}

inline void CopyThirtyTwo(uint8_t* dst, const uint8_t* src) {
    for (int i = 0; i < 128; i += 32) {
        Store(dst + i, Load(src + i));
    }
}

} // namespace

void MaskBlendRow_avx2(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                       const uint8_t* mask, size_t count, const MaskBlend& blend) {
    // Bounds that no byte reaches are compared as 255 or 0 and then not counted.
    const bool allow0 = blend.picture0From <= 255;
    const bool allow1 = blend.picture1UpTo >= 0;
    const __m256i from = _mm256_set1_epi8(static_cast<char>(allow0 ? blend.picture0From : 255));
    const __m256i upTo = _mm256_set1_epi8(static_cast<char>(allow1 ? blend.picture1UpTo : 0));
    size_t i = 0;
    for (; i + 32 <= count; i += 32) {
        const __m256i m = Load(mask + i);
        const size_t at = i * 4;
        if (allow0 && _mm256_movemask_epi8(_mm256_cmpeq_epi8(_mm256_max_epu8(m, from), m)) == -1) {
            CopyThirtyTwo(dst + at, picture0 + at);
        } else if (allow1 &&
                   _mm256_movemask_epi8(_mm256_cmpeq_epi8(_mm256_min_epu8(m, upTo), m)) == -1) {
            CopyThirtyTwo(dst + at, picture1 + at);
        } else {
            for (size_t j = 0; j < 32; j += 8) {
                BlendEight(dst + at + j * 4, picture0 + at + j * 4, picture1 + at + j * 4,
                           mask + i + j, blend);
            }
        }
    }
    MaskBlendRow_scalar(dst + i * 4, picture0 + i * 4, picture1 + i * 4, mask + i, count - i,
                        blend);
}

} // namespace kyv
