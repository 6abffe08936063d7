// The inverse bilinear map with SSE2, two pixels a step. The operations and their order are those
// of the scalar form.
#include "effects/pip/QuadMapRow.h"

#include <emmintrin.h>

namespace kyv {
namespace {

inline __m128d At(const RowCoefficient& coefficient, __m128d x) {
    return _mm_add_pd(_mm_set1_pd(coefficient.base), _mm_mul_pd(_mm_set1_pd(coefficient.step), x));
}

inline __m128d Negate(__m128d value) {
    return _mm_xor_pd(value, _mm_set1_pd(-0.0));
}

inline __m128d Solve(double twiceA, __m128d b, __m128d c, __m128d root) {
    const __m128d value = twiceA == 0.0
                              ? _mm_div_pd(Negate(c), b)
                              : _mm_div_pd(_mm_sub_pd(Negate(b), root), _mm_set1_pd(twiceA));
    // Gives the second operand, 0, for what is not a number.
    const __m128d positive = _mm_max_pd(value, _mm_setzero_pd());
    const __m128d high = _mm_cmpge_pd(positive, _mm_set1_pd(1.0));
    return _mm_or_pd(_mm_and_pd(high, _mm_set1_pd(0.999)), _mm_andnot_pd(high, positive));
}

// In the two low words of 32 bits.
inline __m128i Position(double origin, double range, __m128d part) {
    const __m128d position = _mm_add_pd(_mm_set1_pd(origin), _mm_mul_pd(part, _mm_set1_pd(range)));
    return _mm_cvttpd_epi32(_mm_mul_pd(position, _mm_set1_pd(64.0)));
}

} // namespace

void QuadMapRow_sse2(uint32_t* map, int32_t x, size_t count, const QuadMapRowPlan& plan) {
    __m128d column = _mm_add_pd(_mm_set1_pd(x), _mm_setr_pd(0.0, 1.0));
    size_t i = 0;
    for (; i + 2 <= count; i += 2, column = _mm_add_pd(column, _mm_set1_pd(2.0))) {
        const __m128d b = At(plan.b_t, column);
        const __m128d c = At(plan.c_t, column);
        const __m128d discriminant =
            _mm_sub_pd(_mm_mul_pd(b, b), _mm_mul_pd(_mm_set1_pd(plan.fourA_t), c));
        const __m128d root = _mm_sqrt_pd(_mm_max_pd(discriminant, _mm_setzero_pd()));
        const __m128d s = Solve(plan.twiceA_s, At(plan.b_s, column), At(plan.c_s, column), root);
        const __m128d t = Solve(plan.twiceA_t, b, c, root);
        const __m128i u =
            _mm_and_si128(Position(plan.originU, plan.rangeU, s), _mm_set1_epi32(0xFFFF));
        const __m128i v = _mm_slli_epi32(Position(plan.originV, plan.rangeV, t), 16);
        _mm_storel_epi64(reinterpret_cast<__m128i*>(map + i), _mm_or_si128(u, v));
    }
    QuadMapRow_scalar(map + i, x + static_cast<int32_t>(i), count - i, plan);
}

} // namespace kyv
