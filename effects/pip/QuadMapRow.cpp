// The inverse bilinear map: the definition and the table of forms.
#include "effects/pip/QuadMapRow.h"

namespace kyv {
namespace {

double Solve(double twiceA, double b, double c, double root) {
    const double value = twiceA == 0.0 ? -c / b : (-b - root) / twiceA;
    const double positive = value > 0.0 ? value : 0.0;
    return positive >= 1.0 ? 0.999 : positive;
}

} // namespace

QuadCoordinates SolveQuad(const QuadMapRowPlan& plan, double x) {
    const double b = plan.b_t.At(x);
    const double c = plan.c_t.At(x);
    const double discriminant = b * b - plan.fourA_t * c;
    // Below 0 outside the region that the bilinear image covers.
    const double root = std::sqrt(discriminant > 0.0 ? discriminant : 0.0);
    return {Solve(plan.twiceA_s, plan.b_s.At(x), plan.c_s.At(x), root),
            Solve(plan.twiceA_t, b, c, root)};
}

void QuadMapRow_scalar(uint32_t* map, int32_t x, size_t count, const QuadMapRowPlan& plan) {
    for (size_t i = 0; i < count; ++i) {
        map[i] = MapEntry(plan, x + static_cast<double>(i));
    }
}

constinit const KernelTable<QuadMapRow> kQuadMapRow = {KYV_TABLE(QuadMapRow)};

} // namespace kyv
