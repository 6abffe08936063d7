// ARGB to AYUV with AVX2, eight pixels a step.
#include "imageutility/kernels/ToAYUV.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m256i Factors(int low, int high) {
    return _mm256_set1_epi32(static_cast<int>((static_cast<unsigned>(high) << 16) |
                                              (static_cast<unsigned>(low) & 0xFFFF)));
}

// All sums are kept sixteenfold, so that a result is the high word of its sum. 16 x 2064 would not
// fit 16 bits; green is doubled instead. The constants ride on a word of 1024 beside it.
inline __m256i Weigh(__m256i br, __m256i gc, __m256i brFactors, __m256i gcFactors) {
    return _mm256_add_epi32(_mm256_madd_epi16(br, brFactors), _mm256_madd_epi16(gc, gcFactors));
}

inline __m256i Convert(__m256i bgra) {
    constexpr int kOddWords = 0xAA;
    const __m256i br = _mm256_and_si256(bgra, _mm256_set1_epi32(0x00FF00FF));
    const __m256i ga = _mm256_srli_epi16(bgra, 8);
    const __m256i gc =
        _mm256_blend_epi16(_mm256_add_epi16(ga, ga), _mm256_set1_epi16(1024), kOddWords);
    const __m256i y = Weigh(br, gc, Factors(16 * 401, 16 * 1053), Factors(8 * 2064, 1056));
    const __m256i u = Weigh(br, gc, Factors(16 * 1798, 16 * -606), Factors(8 * -1192, 8224));
    const __m256i v = Weigh(br, gc, Factors(16 * -291, 16 * 1798), Factors(8 * -1507, 8224));
    const __m256i vu = _mm256_blend_epi16(_mm256_srli_epi32(v, 16), u, kOddWords);
    const __m256i ya = _mm256_blend_epi16(_mm256_srli_epi32(y, 16), ga, kOddWords);
    // Four pixels' V and U, then their Y and A.
    return _mm256_shuffle_epi8(_mm256_packus_epi16(vu, ya),
                               _mm256_broadcastsi128_si256(_mm_setr_epi8(
                                   0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15)));
}

} // namespace

void ToAYUV_avx2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i bgra = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i * 4), Convert(bgra));
    }
    ToAYUV_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
