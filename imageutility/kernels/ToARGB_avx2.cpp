// AYUV to ARGB with AVX2, eight pixels a step.
#include "imageutility/kernels/ToARGB.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m256i Factors(int low, int high) {
    return _mm256_set1_epi32(static_cast<int>((static_cast<unsigned>(high) << 16) |
                                              (static_cast<unsigned>(low) & 0xFFFF)));
}

inline __m256i Convert(__m256i vuya) {
    constexpr int kOddWords = 0xAA;
    const __m256i vy = _mm256_and_si256(vuya, _mm256_set1_epi32(0x00FF00FF));
    const __m256i ua = _mm256_srli_epi16(vuya, 8);
    // The offsets of Y, U and V and the rounding half together are multiples of 64, and ride on a
    // word of 64 beside U where they can.
    const __m256i uc = _mm256_blend_epi16(ua, _mm256_set1_epi16(64), kOddWords);
    const __m256i r = _mm256_add_epi32(_mm256_madd_epi16(vy, Factors(6537, 4768)),
                                       _mm256_set1_epi32(64 * -14234));
    const __m256i g = _mm256_add_epi32(_mm256_madd_epi16(vy, Factors(-3330, 4768)),
                                       _mm256_madd_epi16(uc, Factors(-1602, 8704)));
    const __m256i b = _mm256_add_epi32(_mm256_madd_epi16(vy, Factors(0, 4768)),
                                       _mm256_madd_epi16(uc, Factors(8266, -17692)));
    // Signed words, clamped when they are packed: four pixels' B and G, then their R and A.
    const __m256i bg =
        _mm256_blend_epi16(_mm256_srli_epi32(b, 12), _mm256_slli_epi32(g, 4), kOddWords);
    const __m256i ra = _mm256_blend_epi16(_mm256_srli_epi32(r, 12), ua, kOddWords);
    return _mm256_shuffle_epi8(_mm256_packus_epi16(bg, ra),
                               _mm256_broadcastsi128_si256(_mm_setr_epi8(
                                   0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15)));
}

} // namespace

void ToARGB_avx2(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i vuya = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src + i * 4));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i * 4), Convert(vuya));
    }
    ToARGB_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv
