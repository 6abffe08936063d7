// Luma with AVX2.
#include "imageutility/kernels/ToGray.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Factors for the low and the high 16 bits of every pixel.
inline __m256i Factors(int low, int high) {
    return _mm256_set1_epi32(high << 16 | low);
}

inline __m256i Load(const uint8_t* pixels) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(pixels));
}

// Sixteen times the luma of eight pixels: it is the high word of each 32 bits. 16 x 2064 would not
// fit 16 bits; green is doubled instead. The constant rides on a word of 1024 beside it.
inline __m256i Luma(__m256i bgra) {
    constexpr int kOddWords = 0xAA;
    const __m256i br = _mm256_and_si256(bgra, _mm256_set1_epi32(0x00FF00FF));
    const __m256i green = _mm256_and_si256(_mm256_srli_epi32(bgra, 7), _mm256_set1_epi32(0x1FE));
    const __m256i gc = _mm256_blend_epi16(green, _mm256_set1_epi16(1024), kOddWords);
    return _mm256_add_epi32(_mm256_madd_epi16(br, Factors(16 * 401, 16 * 1053)),
                            _mm256_madd_epi16(gc, Factors(8 * 2064, 1056)));
}

// The luma of sixteen pixels as words: in each half four of the first eight, four of the last.
inline __m256i LumaWords(const uint8_t* pixels) {
    return _mm256_packs_epi32(_mm256_srli_epi32(Luma(Load(pixels)), 16),
                              _mm256_srli_epi32(Luma(Load(pixels + 32)), 16));
}

} // namespace

void ToGray_avx2(uint8_t* pixels, size_t count) {
    const __m256i spread = _mm256_broadcastsi128_si256(
        _mm_setr_epi8(2, 2, 2, -1, 6, 6, 6, -1, 10, 10, 10, -1, 14, 14, 14, -1));
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i bgra = Load(pixels + i * 4);
        const __m256i gray = _mm256_shuffle_epi8(Luma(bgra), spread);
        const __m256i alpha = _mm256_and_si256(bgra, _mm256_set1_epi32(-0x1000000));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(pixels + i * 4),
                            _mm256_or_si256(gray, alpha));
    }
    ToGray_scalar(pixels + i * 4, count - i);
}

void ToGrayBytes_avx2(uint8_t* dst, const uint8_t* src, size_t count) {
    const __m256i order = _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7);
    size_t i = 0;
    for (; i + 32 <= count; i += 32) {
        const __m256i bytes =
            _mm256_packus_epi16(LumaWords(src + i * 4), LumaWords(src + i * 4 + 64));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i),
                            _mm256_permutevar8x32_epi32(bytes, order));
    }
    ToGrayBytes_scalar(dst + i, src + i * 4, count - i);
}

} // namespace kyv
