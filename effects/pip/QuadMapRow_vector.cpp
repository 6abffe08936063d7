// The inverse bilinear map. The operations and their order are those of the scalar form.
#include "effects/pip/QuadMapRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

inline Doubles At(const RowCoefficient& coefficient, Doubles x) {
    return AddF64(SplatF64(coefficient.base), MulF64(SplatF64(coefficient.step), x));
}

template <bool kLinear>
inline Doubles Solve(double twiceA, Doubles b, Doubles c, Doubles root) {
    const Doubles value =
        kLinear ? DivF64(NegateF64(c), b) : DivF64(SubF64(NegateF64(b), root), SplatF64(twiceA));
    // Gives the second operand, 0, for what is not a number.
    const Doubles positive = MaxF64(value, SplatF64(0.0));
    return SelectLessF64(positive, SplatF64(1.0), positive, SplatF64(0.999));
}

struct Positions {
    Doubles u;
    Doubles v;
};

inline Doubles Position(double origin, double range, Doubles part) {
    const Doubles position = AddF64(SplatF64(origin), MulF64(part, SplatF64(range)));
    return MulF64(position, SplatF64(64.0));
}

// A quadratic without its square needs no root.
template <bool kLinearS, bool kLinearT>
inline Positions Map(const QuadMapRowPlan& plan, Doubles x) {
    const Doubles b = At(plan.b_t, x);
    const Doubles c = At(plan.c_t, x);
    Doubles root = SplatF64(0.0);
    if (!kLinearS || !kLinearT) {
        const Doubles discriminant = SubF64(MulF64(b, b), MulF64(SplatF64(plan.fourA_t), c));
        root = SqrtF64(MaxF64(discriminant, root));
    }
    const Doubles s = Solve<kLinearS>(plan.twiceA_s, At(plan.b_s, x), At(plan.c_s, x), root);
    const Doubles t = Solve<kLinearT>(plan.twiceA_t, b, c, root);
    return {Position(plan.originU, plan.rangeU, s), Position(plan.originV, plan.rangeV, t)};
}

// The number of pixels done.
template <bool kLinearS, bool kLinearT>
inline size_t Run(uint32_t* map, int32_t first, size_t count, const QuadMapRowPlan& plan) {
    const Floats ascending = F32FromS32(Ascending32());
    Doubles low = AddF64(SplatF64(first), LowF64(ascending));
    Doubles high = AddF64(SplatF64(first), HighF64(ascending));
    const Doubles step = SplatF64(static_cast<double>(kPixels));
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Positions one = Map<kLinearS, kLinearT>(plan, low);
        const Positions two = Map<kLinearS, kLinearT>(plan, high);
        const Vec u = TruncateF64(one.u, two.u);
        const Vec v = TruncateF64(one.v, two.v);
        Store(map + i, MixWords(u, ShiftLeft32<16>(v)));
        low = AddF64(low, step);
        high = AddF64(high, step);
    }
    return i;
}

} // namespace

void QuadMapRow(uint32_t* map, int32_t x, size_t count, const QuadMapRowPlan& plan) {
    const bool linearS = plan.twiceA_s == 0.0;
    const bool linearT = plan.twiceA_t == 0.0;
    const size_t done = linearS ? (linearT ? Run<true, true>(map, x, count, plan)
                                           : Run<true, false>(map, x, count, plan))
                                : (linearT ? Run<false, true>(map, x, count, plan)
                                           : Run<false, false>(map, x, count, plan));
    QuadMapRow_scalar(map + done, x + static_cast<int32_t>(done), count - done, plan);
}

} // namespace kyv::KYV_VECTOR_SET
