// The rules of StyleMath.h for sixteen words, and the way between eight pixels and their words.
// Static, so that nothing compiled for one instruction set can stand in for another.
#pragma once

#include <immintrin.h>
#include <stdint.h>

namespace kyv {

// Eight pixels of B, G, R, A as words: of each half of the vector the first two and the last two.
struct Words {
    __m256i low;
    __m256i high;
};

static inline __m256i Load(const uint8_t* from) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
}
static inline void Store(uint8_t* to, __m256i value) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), value);
}
static inline __m256i Splat(uint32_t word) {
    return _mm256_set1_epi16(static_cast<int16_t>(word));
}

static inline Words Widen(__m256i pixels) {
    const __m256i zero = _mm256_setzero_si256();
    return {_mm256_unpacklo_epi8(pixels, zero), _mm256_unpackhi_epi8(pixels, zero)};
}
static inline __m256i Narrow(__m256i low, __m256i high) {
    return _mm256_packus_epi16(low, high);
}

// One value a pixel, in doublewords below 65536, for every channel of the pixel.
static inline Words Spread(__m256i values) {
    const __m256i twice = _mm256_or_si256(values, _mm256_slli_epi32(values, 16));
    return {_mm256_unpacklo_epi32(twice, twice), _mm256_unpackhi_epi32(twice, twice)};
}

// StyleLuma of eight pixels, in doublewords.
static inline __m256i Luma(Words pixels) {
    const __m256i weights =
        _mm256_set1_epi64x(static_cast<int64_t>(uint64_t{77} << 32 | uint64_t{150} << 16 | 29));
    const __m256 low = _mm256_castsi256_ps(_mm256_madd_epi16(pixels.low, weights));
    const __m256 high = _mm256_castsi256_ps(_mm256_madd_epi16(pixels.high, weights));
    const __m256i even = _mm256_castps_si256(_mm256_shuffle_ps(low, high, _MM_SHUFFLE(2, 0, 2, 0)));
    const __m256i odd = _mm256_castps_si256(_mm256_shuffle_ps(low, high, _MM_SHUFFLE(3, 1, 3, 1)));
    return _mm256_srli_epi32(_mm256_add_epi32(_mm256_add_epi32(even, odd), _mm256_set1_epi32(128)),
                             8);
}

static inline __m256i Mix(__m256i a, __m256i b, __m256i weight) {
    const __m256i rest = _mm256_sub_epi16(Splat(256), weight);
    const __m256i sum =
        _mm256_add_epi16(_mm256_mullo_epi16(a, rest), _mm256_mullo_epi16(b, weight));
    return _mm256_srli_epi16(_mm256_add_epi16(sum, Splat(128)), 8);
}

static inline __m256i Product(__m256i a, __m256i b) {
    const __m256i t = _mm256_add_epi16(_mm256_mullo_epi16(a, b), Splat(128));
    return _mm256_srli_epi16(_mm256_add_epi16(t, _mm256_srli_epi16(t, 8)), 8);
}

// (a * weight + 128) >> 8 for values of 0..255 and weights of 0..256.
static inline __m256i Scale(__m256i a, __m256i weight) {
    return _mm256_srli_epi16(_mm256_add_epi16(_mm256_mullo_epi16(a, weight), Splat(128)), 8);
}

static inline __m256i Invert(__m256i value) {
    return _mm256_xor_si256(value, Splat(255));
}

// The alpha of one and the colours of the other.
static inline __m256i WithAlphaOf(__m256i alpha, __m256i colors) {
    const __m256i mask = _mm256_set1_epi32(static_cast<int32_t>(0xFF000000));
    return _mm256_or_si256(_mm256_and_si256(mask, alpha), _mm256_andnot_si256(mask, colors));
}

// One byte a pixel as doublewords.
static inline __m256i LoadBytes(const uint8_t* from) {
    return _mm256_cvtepu8_epi32(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from)));
}

// Sixteen bytes as words, and back.
static inline __m256i LoadWide(const uint8_t* from) {
    return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(from)));
}
static inline void StoreNarrow(uint8_t* to, __m256i words) {
    _mm_storeu_si128(
        reinterpret_cast<__m128i*>(to),
        _mm_packus_epi16(_mm256_castsi256_si128(words), _mm256_extracti128_si256(words, 1)));
}

} // namespace kyv
