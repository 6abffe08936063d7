// The inverse bilinear map with AVX2, four pixels a step. The operations and their order are those
// of the scalar form.
#include "effects/pip/QuadMapRow.h"

#include <immintrin.h>

namespace kyv {
namespace {

inline __m256d At(const RowCoefficient& coefficient, __m256d x) {
    return _mm256_add_pd(_mm256_set1_pd(coefficient.base),
                         _mm256_mul_pd(_mm256_set1_pd(coefficient.step), x));
}

inline __m256d Negate(__m256d value) {
    return _mm256_xor_pd(value, _mm256_set1_pd(-0.0));
}

template <bool kLinear>
inline __m256d Solve(double twiceA, __m256d b, __m256d c, __m256d root) {
    const __m256d value =
        kLinear ? _mm256_div_pd(Negate(c), b)
                : _mm256_div_pd(_mm256_sub_pd(Negate(b), root), _mm256_set1_pd(twiceA));
    // Gives the second operand, 0, for what is not a number.
    const __m256d positive = _mm256_max_pd(value, _mm256_setzero_pd());
    return _mm256_blendv_pd(positive, _mm256_set1_pd(0.999),
                            _mm256_cmp_pd(positive, _mm256_set1_pd(1.0), _CMP_GE_OQ));
}

inline __m128i Position(double origin, double range, __m256d part) {
    const __m256d position =
        _mm256_add_pd(_mm256_set1_pd(origin), _mm256_mul_pd(part, _mm256_set1_pd(range)));
    return _mm256_cvttpd_epi32(_mm256_mul_pd(position, _mm256_set1_pd(64.0)));
}

// The number of pixels done. A quadratic without its square needs no root.
template <bool kLinearS, bool kLinearT>
inline size_t Run(uint32_t* map, int32_t first, size_t count, const QuadMapRowPlan& plan) {
    __m256d x = _mm256_add_pd(_mm256_set1_pd(first), _mm256_setr_pd(0.0, 1.0, 2.0, 3.0));
    size_t i = 0;
    for (; i + 4 <= count; i += 4, x = _mm256_add_pd(x, _mm256_set1_pd(4.0))) {
        const __m256d b = At(plan.b_t, x);
        const __m256d c = At(plan.c_t, x);
        __m256d root = _mm256_setzero_pd();
        if (!kLinearS || !kLinearT) {
            const __m256d discriminant =
                _mm256_sub_pd(_mm256_mul_pd(b, b), _mm256_mul_pd(_mm256_set1_pd(plan.fourA_t), c));
            root = _mm256_sqrt_pd(_mm256_max_pd(discriminant, root));
        }
        const __m256d s = Solve<kLinearS>(plan.twiceA_s, At(plan.b_s, x), At(plan.c_s, x), root);
        const __m256d t = Solve<kLinearT>(plan.twiceA_t, b, c, root);
        const __m128i u = Position(plan.originU, plan.rangeU, s);
        const __m128i v = Position(plan.originV, plan.rangeV, t);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(map + i),
                         _mm_blend_epi16(u, _mm_slli_epi32(v, 16), 0xAA));
    }
    return i;
}

} // namespace

void QuadMapRow_avx2(uint32_t* map, int32_t x, size_t count, const QuadMapRowPlan& plan) {
    const bool linearS = plan.twiceA_s == 0.0;
    const bool linearT = plan.twiceA_t == 0.0;
    const size_t done = linearS ? (linearT ? Run<true, true>(map, x, count, plan)
                                           : Run<true, false>(map, x, count, plan))
                                : (linearT ? Run<false, true>(map, x, count, plan)
                                           : Run<false, false>(map, x, count, plan));
    QuadMapRow_scalar(map + done, x + static_cast<int32_t>(done), count - done, plan);
}

} // namespace kyv
