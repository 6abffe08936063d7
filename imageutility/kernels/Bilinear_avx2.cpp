// Bilinear resizing with AVX2, eight pixels a step.
#include "imageutility/kernels/Bilinear.h"

#include <immintrin.h>

namespace kyv {
namespace {

// Two neighbour pairs, eight bytes each.
inline __m128i LoadPairs(const uint8_t* src, const int32_t* left) {
    const auto* first = reinterpret_cast<const __m128i*>(src + static_cast<ptrdiff_t>(left[0]) * 4);
    const auto* second = reinterpret_cast<const double*>(src + static_cast<ptrdiff_t>(left[1]) * 4);
    return _mm_castpd_si128(_mm_loadh_pd(_mm_castsi128_pd(_mm_loadl_epi64(first)), second));
}

// Four pixels less 128, 16 bits a channel, from their neighbours' interleaved bytes. The weights go
// up to 128, which only the unsigned operand holds, so the pixels are the signed one.
inline __m256i Interpolate(__m256i neighbours, __m256i weights) {
    const __m256i centered = _mm256_xor_si256(neighbours, _mm256_set1_epi8(-128));
    return _mm256_srai_epi16(_mm256_maddubs_epi16(weights, centered), 7);
}

// The neighbours of pixels 0, 1 and 4, 5 from left on, a load for each.
inline __m256i Gather(const uint8_t* src, const int32_t* left) {
    const __m256i interleave = _mm256_broadcastsi128_si256(
        _mm_setr_epi8(0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15));
    const __m256i pairs = _mm256_inserti128_si256(_mm256_castsi128_si256(LoadPairs(src, left)),
                                                  LoadPairs(src, left + 4), 1);
    return _mm256_shuffle_epi8(pairs, interleave);
}

// The neighbours of pixels 0, 1 and 2, 3 from left on, a load for every two.
inline __m256i Shuffle(const uint8_t* src, const int32_t* left, const uint8_t* shuffles) {
    const auto load = [src](int32_t pixel) {
        return _mm_loadu_si128(
            reinterpret_cast<const __m128i*>(src + static_cast<ptrdiff_t>(pixel) * 4));
    };
    return _mm256_shuffle_epi8(
        _mm256_inserti128_si256(_mm256_castsi128_si256(load(left[0])), load(left[2]), 1),
        _mm256_loadu_si256(reinterpret_cast<const __m256i*>(shuffles)));
}

inline __m256i LoadWeights(const uint8_t* weights) {
    return _mm256_broadcastsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(weights)));
}

inline void StorePixels(uint8_t* dst, __m256i pixels) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst),
                        _mm256_xor_si256(pixels, _mm256_set1_epi8(-128)));
}

// Repeats the two weights of pixels at the given places for four channels: a and b in the low half,
// c and d in the high one.
inline __m256i Spread(char a, char b, char c, char d) {
    const auto pair = [](char low, char high) {
        const auto l = static_cast<short>(0x0100 + 0x0202 * low);
        const auto h = static_cast<short>(0x0100 + 0x0202 * high);
        return _mm_setr_epi16(l, l, l, l, h, h, h, h);
    };
    return _mm256_inserti128_si256(_mm256_castsi128_si256(pair(a, b)), pair(c, d), 1);
}

} // namespace

void Bilinear_avx2(uint8_t* dst, const uint8_t* src, size_t count, const BilinearColumns& columns) {
    size_t i = 0;
    for (; i + 8 <= columns.shuffled; i += 8) {
        const __m256i weights = LoadWeights(columns.weights + 2 * i);
        const __m256i first = Interpolate(Shuffle(src, columns.left + i, columns.shuffles + 8 * i),
                                          _mm256_shuffle_epi8(weights, Spread(0, 1, 2, 3)));
        const __m256i second =
            Interpolate(Shuffle(src, columns.left + i + 4, columns.shuffles + 8 * i + 32),
                        _mm256_shuffle_epi8(weights, Spread(4, 5, 6, 7)));
        constexpr int kMiddleSwapped = 0xD8;
        StorePixels(dst + i * 4,
                    _mm256_permute4x64_epi64(_mm256_packs_epi16(first, second), kMiddleSwapped));
    }
    for (; i + 8 <= count; i += 8) {
        const __m256i weights = LoadWeights(columns.weights + 2 * i);
        const __m256i first = Interpolate(Gather(src, columns.left + i),
                                          _mm256_shuffle_epi8(weights, Spread(0, 1, 4, 5)));
        const __m256i second = Interpolate(Gather(src, columns.left + i + 2),
                                           _mm256_shuffle_epi8(weights, Spread(2, 3, 6, 7)));
        StorePixels(dst + i * 4, _mm256_packs_epi16(first, second));
    }
    Bilinear_scalar(dst + i * 4, src, count - i, {columns.left + i, columns.weights + 2 * i});
}

void Lerp_avx2(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
               uint32_t fraction) {
    // Weights up to 127 fit in signed bytes. A fraction of 0 takes both halves from the upper row.
    const uint8_t* second = fraction == 0 ? upper : lower;
    const uint32_t f = fraction == 0 ? 64 : fraction;
    const __m256i weights = _mm256_set1_epi16(static_cast<short>((f << 8) | (128 - f)));
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i a = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(upper + i * 4));
        const __m256i b = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(second + i * 4));
        const __m256i low = _mm256_maddubs_epi16(_mm256_unpacklo_epi8(a, b), weights);
        const __m256i high = _mm256_maddubs_epi16(_mm256_unpackhi_epi8(a, b), weights);
        _mm256_storeu_si256(
            reinterpret_cast<__m256i*>(dst + i * 4),
            _mm256_packus_epi16(_mm256_srli_epi16(low, 7), _mm256_srli_epi16(high, 7)));
    }
    Lerp_scalar(dst + i * 4, upper + i * 4, lower + i * 4, count - i, fraction);
}

} // namespace kyv
