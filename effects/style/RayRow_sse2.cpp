// Eight words or four pixels a step; the rest of a row goes through the scalar form.
#include "effects/style/RayRow.h"
#include "effects/style/StyleVector_sse2.h"

namespace kyv {
namespace {

__m128i LoadWords(const uint16_t* from) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

__m128i Between(__m128i a, __m128i b, __m128i fraction) {
    const __m128i rest = _mm_xor_si128(fraction, Splat(65535));
    return _mm_add_epi16(_mm_mulhi_epu16(a, rest), _mm_mulhi_epu16(b, fraction));
}

} // namespace

void RayLerpRow_sse2(uint16_t* dst, const uint16_t* upper, const uint16_t* lower, size_t count,
                     uint16_t fraction) {
    const __m128i way = Splat(fraction);
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i),
                         Between(LoadWords(upper + i), LoadWords(lower + i), way));
    }
    RayLerpRow_scalar(dst + i, upper + i, lower + i, count - i, fraction);
}

void RayStepRow_sse2(uint16_t* dst, const uint16_t* src, const uint16_t* row, size_t count,
                     const RayColumns& columns, const RayShares& shares) {
    const __m128i kept = Splat(shares.kept);
    const __m128i brought = Splat(shares.brought);
    size_t i = 0;
    for (; i + 2 <= count; i += 2) {
        const __m128i first = LoadWords(row + size_t{4} * static_cast<uint32_t>(columns.left[i]));
        const __m128i second =
            LoadWords(row + size_t{4} * static_cast<uint32_t>(columns.left[i + 1]));
        int32_t both;
        __builtin_memcpy(&both, columns.fractions + i, 4);
        __m128i fraction = _mm_cvtsi32_si128(both);
        fraction = _mm_unpacklo_epi16(fraction, fraction);
        fraction = _mm_unpacklo_epi32(fraction, fraction);
        const __m128i moved =
            Between(_mm_unpacklo_epi64(first, second), _mm_unpackhi_epi64(first, second), fraction);
        const __m128i own = LoadWords(src + i * 4);
        _mm_storeu_si128(
            reinterpret_cast<__m128i*>(dst + i * 4),
            _mm_add_epi16(_mm_mulhi_epu16(own, kept), _mm_mulhi_epu16(moved, brought)));
    }
    RayStepRow_scalar(dst + i * 4, src + i * 4, row, count - i,
                      {columns.left + i, columns.fractions + i}, shares);
}

void RayAddRow_sse2(uint8_t* dst, const uint8_t* src, const uint8_t* light, size_t count) {
    const __m128i byte = _mm_set1_epi32(255);
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128i pixels = Load(src + i * 4);
        const __m128i strongest =
            _mm_and_si128(_mm_max_epu8(_mm_max_epu8(pixels, _mm_srli_epi32(pixels, 8)),
                                       _mm_srli_epi32(pixels, 16)),
                          byte);
        const Words spread = Spread(strongest);
        const __m128i all = _mm_packus_epi16(spread.low, spread.high);
        const Words room = Widen(_mm_xor_si128(_mm_avg_epu8(pixels, all), _mm_set1_epi8(-1)));
        const Words add = Widen(Load(light + i * 4));
        const __m128i sum =
            _mm_adds_epu8(pixels, Narrow(Product(add.low, room.low), Product(add.high, room.high)));
        Store(dst + i * 4, WithAlphaOf(pixels, sum));
    }
    RayAddRow_scalar(dst + i * 4, src + i * 4, light + i * 4, count - i);
}

} // namespace kyv
