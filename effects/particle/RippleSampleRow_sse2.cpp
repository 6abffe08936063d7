// Four pixels a step; the rest of a row goes through the scalar form.
#include <emmintrin.h>

#include "effects/particle/RippleSampleRow.h"

namespace kyv {
namespace {

struct Places {
    __m128i whole;
    __m128i fraction; // in both halves of each 32 bits
};

Places Move(__m128 pixel, __m128 offset, __m128 last) {
    const __m128 moved = _mm_max_ps(_mm_min_ps(_mm_add_ps(pixel, offset), last), _mm_setzero_ps());
    const __m128i whole = _mm_cvttps_epi32(moved);
    const __m128 rest = _mm_sub_ps(moved, _mm_cvtepi32_ps(whole));
    const __m128i fraction = _mm_cvttps_epi32(_mm_mul_ps(rest, _mm_set1_ps(65536.0F)));
    return {whole, _mm_or_si128(fraction, _mm_slli_epi32(fraction, 16))};
}

// a + floor((b - a) * fraction / 65536) in 16 bits. The multiplication takes the fraction as
// signed; where that made it negative, 65536 too little, one difference is added.
__m128i Between(__m128i a, __m128i b, __m128i fraction) {
    const __m128i difference = _mm_sub_epi16(b, a);
    const __m128i missing = _mm_and_si128(difference, _mm_srai_epi16(fraction, 15));
    return _mm_add_epi16(_mm_add_epi16(a, missing), _mm_mulhi_epi16(difference, fraction));
}

// Two neighbours of each of two places, interpolated: two pixels of 16 bits a channel.
__m128i Across(const uint8_t* first, const uint8_t* second, __m128i fraction) {
    const __m128i a = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(first));
    const __m128i b = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(second));
    const __m128i sorted = _mm_unpacklo_epi32(a, b); // two left ones, two right ones
    const __m128i zero = _mm_setzero_si128();
    return Between(_mm_unpacklo_epi8(sorted, zero), _mm_unpackhi_epi8(sorted, zero), fraction);
}

} // namespace

void RippleSampleRow_sse2(uint8_t* dst, const RipplePicture& picture, int32_t x, int32_t y,
                          const float* offsets, size_t count) {
    const __m128 lastX = _mm_set1_ps(static_cast<float>(picture.width - 1));
    const __m128 lastY = _mm_set1_ps(static_cast<float>(picture.height - 1));
    const __m128 row = _mm_set1_ps(static_cast<float>(y));
    const __m128i opaque = _mm_set1_epi32(static_cast<int32_t>(0xFF000000));
    const __m128i lane = _mm_set_epi32(3, 2, 1, 0);
    const ptrdiff_t pitch = picture.pitchBytes;
    size_t i = 0;
    for (; i + 4 <= count; i += 4) {
        const __m128 offset = _mm_loadu_ps(offsets + i);
        const __m128i column = _mm_add_epi32(_mm_set1_epi32(x + static_cast<int32_t>(i)), lane);
        const Places across = Move(_mm_cvtepi32_ps(column), offset, lastX);
        const Places down = Move(row, offset, lastY);
        int32_t columns[4];
        int32_t rows[4];
        _mm_storeu_si128(reinterpret_cast<__m128i*>(columns), across.whole);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(rows), down.whole);
        const uint8_t* place[4];
        for (int j = 0; j < 4; ++j) {
            place[j] = picture.pixels + rows[j] * pitch + ptrdiff_t{columns[j]} * 4;
        }
        __m128i halves[2];
        const __m128i fx[2] = {_mm_shuffle_epi32(across.fraction, _MM_SHUFFLE(1, 1, 0, 0)),
                               _mm_shuffle_epi32(across.fraction, _MM_SHUFFLE(3, 3, 2, 2))};
        const __m128i fy[2] = {_mm_shuffle_epi32(down.fraction, _MM_SHUFFLE(1, 1, 0, 0)),
                               _mm_shuffle_epi32(down.fraction, _MM_SHUFFLE(3, 3, 2, 2))};
        for (int j = 0; j < 2; ++j) {
            const __m128i top = Across(place[2 * j], place[2 * j + 1], fx[j]);
            const __m128i bottom = Across(place[2 * j] + pitch, place[2 * j + 1] + pitch, fx[j]);
            halves[j] = Between(top, bottom, fy[j]);
        }
        const __m128i result = _mm_or_si128(_mm_packus_epi16(halves[0], halves[1]), opaque);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * 4), result);
    }
    RippleSampleRow_scalar(dst + i * 4, picture, x + static_cast<int32_t>(i), y, offsets + i,
                           count - i);
}

} // namespace kyv
