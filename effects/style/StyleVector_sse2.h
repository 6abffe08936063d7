// The rules of StyleMath.h for eight words, and the way between four pixels and their words.
// Static, so that nothing compiled for one instruction set can stand in for another.
#pragma once

#include <emmintrin.h>
#include <stdint.h>

namespace kyv {

// Four pixels of B, G, R, A as words: the first two and the last two.
struct Words {
    __m128i low;
    __m128i high;
};

static inline __m128i Load(const uint8_t* from) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}
static inline void Store(uint8_t* to, __m128i value) {
    _mm_storeu_si128(reinterpret_cast<__m128i*>(to), value);
}
static inline __m128i Splat(uint32_t word) {
    return _mm_set1_epi16(static_cast<int16_t>(word));
}

static inline Words Widen(__m128i pixels) {
    const __m128i zero = _mm_setzero_si128();
    return {_mm_unpacklo_epi8(pixels, zero), _mm_unpackhi_epi8(pixels, zero)};
}
static inline __m128i Narrow(__m128i low, __m128i high) {
    return _mm_packus_epi16(low, high);
}

// One value a pixel, in doublewords below 65536, for every channel of the pixel.
static inline Words Spread(__m128i values) {
    const __m128i twice = _mm_or_si128(values, _mm_slli_epi32(values, 16));
    return {_mm_unpacklo_epi32(twice, twice), _mm_unpackhi_epi32(twice, twice)};
}

// StyleLuma of four pixels, in doublewords.
static inline __m128i Luma(Words pixels) {
    const __m128i weights =
        _mm_set1_epi64x(static_cast<int64_t>(uint64_t{77} << 32 | uint64_t{150} << 16 | 29));
    const __m128 low = _mm_castsi128_ps(_mm_madd_epi16(pixels.low, weights));
    const __m128 high = _mm_castsi128_ps(_mm_madd_epi16(pixels.high, weights));
    const __m128i even = _mm_castps_si128(_mm_shuffle_ps(low, high, _MM_SHUFFLE(2, 0, 2, 0)));
    const __m128i odd = _mm_castps_si128(_mm_shuffle_ps(low, high, _MM_SHUFFLE(3, 1, 3, 1)));
    return _mm_srli_epi32(_mm_add_epi32(_mm_add_epi32(even, odd), _mm_set1_epi32(128)), 8);
}

static inline __m128i Mix(__m128i a, __m128i b, __m128i weight) {
    const __m128i rest = _mm_sub_epi16(Splat(256), weight);
    const __m128i sum = _mm_add_epi16(_mm_mullo_epi16(a, rest), _mm_mullo_epi16(b, weight));
    return _mm_srli_epi16(_mm_add_epi16(sum, Splat(128)), 8);
}

static inline __m128i Product(__m128i a, __m128i b) {
    const __m128i t = _mm_add_epi16(_mm_mullo_epi16(a, b), Splat(128));
    return _mm_srli_epi16(_mm_add_epi16(t, _mm_srli_epi16(t, 8)), 8);
}

// (a * weight + 128) >> 8 for values of 0..255 and weights of 0..256.
static inline __m128i Scale(__m128i a, __m128i weight) {
    return _mm_srli_epi16(_mm_add_epi16(_mm_mullo_epi16(a, weight), Splat(128)), 8);
}

static inline __m128i Invert(__m128i value) {
    return _mm_xor_si128(value, Splat(255));
}

// The alpha of one and the colours of the other.
static inline __m128i WithAlphaOf(__m128i alpha, __m128i colors) {
    const __m128i mask = _mm_set1_epi32(static_cast<int32_t>(0xFF000000));
    return _mm_or_si128(_mm_and_si128(mask, alpha), _mm_andnot_si128(mask, colors));
}

// One byte a pixel as doublewords.
static inline __m128i LoadBytes(const uint8_t* from) {
    int32_t bytes;
    __builtin_memcpy(&bytes, from, 4);
    const __m128i zero = _mm_setzero_si128();
    return _mm_unpacklo_epi16(_mm_unpacklo_epi8(_mm_cvtsi32_si128(bytes), zero), zero);
}

// Eight bytes as words, and back.
static inline __m128i LoadWide(const uint8_t* from) {
    return _mm_unpacklo_epi8(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from)),
                             _mm_setzero_si128());
}
static inline void StoreNarrow(uint8_t* to, __m128i words) {
    _mm_storel_epi64(reinterpret_cast<__m128i*>(to), _mm_packus_epi16(words, words));
}

} // namespace kyv
