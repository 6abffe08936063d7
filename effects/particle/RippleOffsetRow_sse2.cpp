// Four columns a step.
#include <emmintrin.h>

#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/RippleSine.h"

namespace kyv {
namespace {

__m128d Sine(__m128d x) {
    using namespace ripple_sine;
    const __m128d rounder = _mm_set1_pd(kRounder);
    const __m128d rounded = _mm_add_pd(_mm_mul_pd(x, _mm_set1_pd(kOneOverPi)), rounder);
    const __m128d n = _mm_sub_pd(rounded, rounder);
    const __m128d high = _mm_sub_pd(x, _mm_mul_pd(n, _mm_set1_pd(kPiHigh)));
    const __m128d rest = _mm_sub_pd(high, _mm_mul_pd(n, _mm_set1_pd(kPiLow)));
    const __m128d square = _mm_mul_pd(rest, rest);
    __m128d sum = _mm_set1_pd(kTerms[kTermCount - 1]);
    for (int i = kTermCount - 2; i >= 0; --i) {
        sum = _mm_add_pd(_mm_mul_pd(sum, square), _mm_set1_pd(kTerms[i]));
    }
    const __m128d sine = _mm_add_pd(rest, _mm_mul_pd(rest, _mm_mul_pd(square, sum)));
    // The lowest bit of the rounded quotient becomes a sign.
    const __m128i sign = _mm_slli_epi64(_mm_castpd_si128(rounded), 63);
    return _mm_xor_pd(sine, _mm_castsi128_pd(sign));
}

} // namespace

void RippleOffsetRow_sse2(float* offsets, size_t count, int32_t dy, const RippleShape& shape) {
    const __m128 radius = _mm_set1_ps(shape.radius);
    const __m128 wavelength = _mm_set1_ps(shape.wavelength);
    const __m128 amplitude = _mm_set1_ps(shape.amplitude);
    const __m128 phase = _mm_set1_ps(shape.phase);
    const __m128 turn = _mm_set1_ps(6.2831855F);
    float rest[4];
    for (size_t i = 0; i < count; i += 4) {
        const auto dx = static_cast<int32_t>(i);
        const int32_t dy2 = dy * dy;
        // Columns beyond the row's end may be too far for 32 bits; they are not written.
        int32_t squares[4];
        for (int32_t j = 0; j < 4; ++j) {
            squares[j] = i + static_cast<size_t>(j) < count ? (dx + j) * (dx + j) + dy2 : 0;
        }
        const __m128i sums = _mm_set_epi32(squares[3], squares[2], squares[1], squares[0]);
        const __m128 distance = _mm_sqrt_ps(_mm_cvtepi32_ps(sums));
        const __m128 weight = _mm_max_ps(_mm_sub_ps(radius, distance), _mm_setzero_ps());
        const __m128 angle = _mm_add_ps(_mm_mul_ps(_mm_div_ps(distance, wavelength), turn), phase);
        const __m128 low = _mm_cvtpd_ps(Sine(_mm_cvtps_pd(angle)));
        const __m128 high = _mm_cvtpd_ps(Sine(_mm_cvtps_pd(_mm_movehl_ps(angle, angle))));
        const __m128 strength = _mm_mul_ps(_mm_div_ps(weight, radius), amplitude);
        const __m128 result = _mm_mul_ps(strength, _mm_movelh_ps(low, high));
        if (i + 4 <= count) {
            _mm_storeu_ps(offsets + i, result);
            continue;
        }
        _mm_storeu_ps(rest, result);
        for (size_t j = 0; i + j < count; ++j) {
            offsets[i + j] = rest[j];
        }
    }
}

} // namespace kyv
