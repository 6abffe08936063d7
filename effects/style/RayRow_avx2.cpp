// Sixteen words, or four or eight pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/RayRow.h"
#include "effects/style/StyleVector_avx2.h"

namespace kyv {
namespace {

__m256i LoadWords(const uint16_t* from) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
}

__m256i Between(__m256i a, __m256i b, __m256i fraction) {
    const __m256i rest = _mm256_xor_si256(fraction, Splat(65535));
    return _mm256_add_epi16(_mm256_mulhi_epu16(a, rest), _mm256_mulhi_epu16(b, fraction));
}

} // namespace

void RayLerpRow_avx2(uint16_t* dst, const uint16_t* upper, const uint16_t* lower, size_t count,
                     uint16_t fraction) {
    const __m256i way = Splat(fraction);
    size_t i = 0;
    for (; i + 16 <= count; i += 16) {
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i),
                            Between(LoadWords(upper + i), LoadWords(lower + i), way));
    }
    RayLerpRow_scalar(dst + i, upper + i, lower + i, count - i, fraction);
}

void RayStepRow_avx2(uint16_t* dst, const uint16_t* src, const uint16_t* row, size_t count,
                     const RayColumns& columns, const RayShares& shares) {
    const __m256i kept = Splat(shares.kept);
    const __m256i brought = Splat(shares.brought);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        __m128i pair[4]; // a pixel and its right neighbour
        for (size_t k = 0; k < 4; ++k) {
            pair[k] = _mm_loadu_si128(reinterpret_cast<const __m128i*>(
                row + size_t{4} * static_cast<uint32_t>(columns.left[i + k])));
        }
        const __m256i even = _mm256_set_m128i(pair[2], pair[0]);
        const __m256i odd = _mm256_set_m128i(pair[3], pair[1]);
        const __m256i way = _mm256_cvtepu16_epi64(
            _mm_loadl_epi64(reinterpret_cast<const __m128i*>(columns.fractions + i)));
        const __m256i twice = _mm256_or_si256(way, _mm256_slli_epi64(way, 16));
        const __m256i fraction = _mm256_or_si256(twice, _mm256_slli_epi64(twice, 32));
        const __m256i moved =
            Between(_mm256_unpacklo_epi64(even, odd), _mm256_unpackhi_epi64(even, odd), fraction);
        const __m256i own = LoadWords(src + i * 4);
        _mm256_storeu_si256(
            reinterpret_cast<__m256i*>(dst + i * 4),
            _mm256_add_epi16(_mm256_mulhi_epu16(own, kept), _mm256_mulhi_epu16(moved, brought)));
    }
    RayStepRow_scalar(dst + i * 4, src + i * 4, row, count - i,
                      {columns.left + i, columns.fractions + i}, shares);
}

void RayAddRow_avx2(uint8_t* dst, const uint8_t* src, const uint8_t* light, size_t count) {
    const __m256i byte = _mm256_set1_epi32(255);
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256i pixels = Load(src + i * 4);
        const __m256i strongest =
            _mm256_and_si256(_mm256_max_epu8(_mm256_max_epu8(pixels, _mm256_srli_epi32(pixels, 8)),
                                             _mm256_srli_epi32(pixels, 16)),
                             byte);
        const Words spread = Spread(strongest);
        const __m256i all = _mm256_packus_epi16(spread.low, spread.high);
        const Words room =
            Widen(_mm256_xor_si256(_mm256_avg_epu8(pixels, all), _mm256_set1_epi8(-1)));
        const Words add = Widen(Load(light + i * 4));
        const __m256i sum = _mm256_adds_epu8(
            pixels, Narrow(Product(add.low, room.low), Product(add.high, room.high)));
        Store(dst + i * 4, WithAlphaOf(pixels, sum));
    }
    RayAddRow_scalar(dst + i * 4, src + i * 4, light + i * 4, count - i);
}

} // namespace kyv
