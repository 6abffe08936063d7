// Eight pixels a step; the rest of a row goes through the scalar form.
#include <immintrin.h>

#include "effects/particle/RippleSampleRow.h"

namespace kyv {
namespace {

struct Places {
    __m256i whole;
    __m256i fraction; // in both halves of each 32 bits
};

Places Move(__m256 pixel, __m256 offset, __m256 last) {
    const __m256 moved =
        _mm256_max_ps(_mm256_min_ps(_mm256_add_ps(pixel, offset), last), _mm256_setzero_ps());
    const __m256i whole = _mm256_cvttps_epi32(moved);
    const __m256 rest = _mm256_sub_ps(moved, _mm256_cvtepi32_ps(whole));
    const __m256i fraction = _mm256_cvttps_epi32(_mm256_mul_ps(rest, _mm256_set1_ps(65536.0F)));
    return {whole, _mm256_or_si256(fraction, _mm256_slli_epi32(fraction, 16))};
}

// As in the SSE2 form.
__m256i Between(__m256i a, __m256i b, __m256i fraction) {
    const __m256i difference = _mm256_sub_epi16(b, a);
    const __m256i missing = _mm256_and_si256(difference, _mm256_srai_epi16(fraction, 15));
    return _mm256_add_epi16(_mm256_add_epi16(a, missing), _mm256_mulhi_epi16(difference, fraction));
}

__m128i Pair(const uint8_t* first, const uint8_t* second) {
    return _mm_unpacklo_epi32(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(first)),
                              _mm_loadl_epi64(reinterpret_cast<const __m128i*>(second)));
}

// Two neighbours of each of four places, interpolated: pixels 0, 1 and 4, 5 of 16 bits a channel.
__m256i Across(const uint8_t* const* place, ptrdiff_t shift, __m256i fraction) {
    const __m256i sorted = _mm256_set_m128i(Pair(place[4] + shift, place[5] + shift),
                                            Pair(place[0] + shift, place[1] + shift));
    const __m256i zero = _mm256_setzero_si256();
    return Between(_mm256_unpacklo_epi8(sorted, zero), _mm256_unpackhi_epi8(sorted, zero),
                   fraction);
}

} // namespace

void RippleSampleRow_avx2(uint8_t* dst, const RipplePicture& picture, int32_t x, int32_t y,
                          const float* offsets, size_t count) {
    const __m256 lastX = _mm256_set1_ps(static_cast<float>(picture.width - 1));
    const __m256 lastY = _mm256_set1_ps(static_cast<float>(picture.height - 1));
    const __m256 row = _mm256_set1_ps(static_cast<float>(y));
    const __m256i opaque = _mm256_set1_epi32(static_cast<int32_t>(0xFF000000));
    const __m256i lane = _mm256_setr_epi32(0, 1, 2, 3, 4, 5, 6, 7);
    const ptrdiff_t pitch = picture.pitchBytes;
    size_t i = 0;
    for (; i + 8 <= count; i += 8) {
        const __m256 offset = _mm256_loadu_ps(offsets + i);
        const __m256i column =
            _mm256_add_epi32(_mm256_set1_epi32(x + static_cast<int32_t>(i)), lane);
        const Places across = Move(_mm256_cvtepi32_ps(column), offset, lastX);
        const Places down = Move(row, offset, lastY);
        int32_t columns[8];
        int32_t rows[8];
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(columns), across.whole);
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(rows), down.whole);
        const uint8_t* place[8];
        for (int j = 0; j < 8; ++j) {
            place[j] = picture.pixels + rows[j] * pitch + ptrdiff_t{columns[j]} * 4;
        }
        // The first of each pair of pixels in either half of the registers, then the second.
        const __m256i fx0 = _mm256_shuffle_epi32(across.fraction, _MM_SHUFFLE(1, 1, 0, 0));
        const __m256i fx1 = _mm256_shuffle_epi32(across.fraction, _MM_SHUFFLE(3, 3, 2, 2));
        const __m256i fy0 = _mm256_shuffle_epi32(down.fraction, _MM_SHUFFLE(1, 1, 0, 0));
        const __m256i fy1 = _mm256_shuffle_epi32(down.fraction, _MM_SHUFFLE(3, 3, 2, 2));
        const __m256i first = Between(Across(place, 0, fx0), Across(place, pitch, fx0), fy0);
        const __m256i second =
            Between(Across(place + 2, 0, fx1), Across(place + 2, pitch, fx1), fy1);
        const __m256i result = _mm256_or_si256(_mm256_packus_epi16(first, second), opaque);
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i * 4), result);
    }
    RippleSampleRow_scalar(dst + i * 4, picture, x + static_cast<int32_t>(i), y, offsets + i,
                           count - i);
}

} // namespace kyv
