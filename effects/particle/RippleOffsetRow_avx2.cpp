// Eight columns a step.
#include <immintrin.h>

#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/RippleSine.h"

namespace kyv {
namespace {

__m256d Sine(__m256d x) {
    using namespace ripple_sine;
    const __m256d rounder = _mm256_set1_pd(kRounder);
    const __m256d rounded = _mm256_add_pd(_mm256_mul_pd(x, _mm256_set1_pd(kOneOverPi)), rounder);
    const __m256d n = _mm256_sub_pd(rounded, rounder);
    const __m256d high = _mm256_sub_pd(x, _mm256_mul_pd(n, _mm256_set1_pd(kPiHigh)));
    const __m256d rest = _mm256_sub_pd(high, _mm256_mul_pd(n, _mm256_set1_pd(kPiLow)));
    const __m256d square = _mm256_mul_pd(rest, rest);
    __m256d sum = _mm256_set1_pd(kTerms[kTermCount - 1]);
    for (int i = kTermCount - 2; i >= 0; --i) {
        sum = _mm256_add_pd(_mm256_mul_pd(sum, square), _mm256_set1_pd(kTerms[i]));
    }
    const __m256d sine = _mm256_add_pd(rest, _mm256_mul_pd(rest, _mm256_mul_pd(square, sum)));
    // The lowest bit of the rounded quotient becomes a sign.
    const __m256i sign = _mm256_slli_epi64(_mm256_castpd_si256(rounded), 63);
    return _mm256_xor_pd(sine, _mm256_castsi256_pd(sign));
}

} // namespace

void RippleOffsetRow_avx2(float* offsets, size_t count, int32_t dy, const RippleShape& shape) {
    const __m256 radius = _mm256_set1_ps(shape.radius);
    const __m256 wavelength = _mm256_set1_ps(shape.wavelength);
    const __m256 amplitude = _mm256_set1_ps(shape.amplitude);
    const __m256 phase = _mm256_set1_ps(shape.phase);
    const __m256 turn = _mm256_set1_ps(6.2831855F);
    const __m256i dy2 = _mm256_set1_epi32(dy * dy);
    const __m256i columns = _mm256_setr_epi32(0, 1, 2, 3, 4, 5, 6, 7);
    for (size_t i = 0; i < count; i += 8) {
        // Columns beyond the row's end may be too far for 32 bits; they are not written.
        const __m256i dx = _mm256_add_epi32(_mm256_set1_epi32(static_cast<int32_t>(i)), columns);
        const __m256i sums = _mm256_add_epi32(_mm256_mullo_epi32(dx, dx), dy2);
        const __m256 distance = _mm256_sqrt_ps(_mm256_cvtepi32_ps(sums));
        const __m256 weight = _mm256_max_ps(_mm256_sub_ps(radius, distance), _mm256_setzero_ps());
        const __m256 angle =
            _mm256_add_ps(_mm256_mul_ps(_mm256_div_ps(distance, wavelength), turn), phase);
        const __m128 low = _mm256_cvtpd_ps(Sine(_mm256_cvtps_pd(_mm256_castps256_ps128(angle))));
        const __m128 high = _mm256_cvtpd_ps(Sine(_mm256_cvtps_pd(_mm256_extractf128_ps(angle, 1))));
        const __m256 strength = _mm256_mul_ps(_mm256_div_ps(weight, radius), amplitude);
        const __m256 result = _mm256_mul_ps(strength, _mm256_set_m128(high, low));
        if (i + 8 <= count) {
            _mm256_storeu_ps(offsets + i, result);
            continue;
        }
        const __m256i left = _mm256_set1_epi32(static_cast<int32_t>(count - i));
        _mm256_maskstore_ps(offsets + i, _mm256_cmpgt_epi32(left, columns), result);
    }
}

} // namespace kyv
