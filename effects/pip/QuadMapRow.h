// The inverse bilinear map along a row of the frame: for every pixel of a quad the position in the
// picture that is drawn there.
//
// A quad A, B, C, D is the bilinear image of the unit square, s along A to B and t along A to D.
// With e = B - A, f = D - A, g = A - B + C - D and h = P - A for the pixel P,
//
//     h = s e + t f + s t g
//
// gives a quadratic for s and one for t, whose coefficients b and c are linear in P. Both have the
// same discriminant, which is the square of the map's Jacobian.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// One coefficient along a row: base + step * x. In frames of sane size all of them are whole
// numbers that a double holds exactly.
struct RowCoefficient {
    double base;
    double step;

    double At(double x) const { return base + step * x; }
};

// What is the same for a row.
struct QuadMapRowPlan {
    // a s^2 + b s + c = 0, signed so that (-b - root) / (2 a) is the solution inside the quad.
    double twiceA_s;
    double twiceA_t;
    double fourA_t;
    RowCoefficient b_s, c_s;
    RowCoefficient b_t, c_t;
    // The picture's corner at s = t = 0 and the way to the opposite one, in pixels.
    double originU, originV;
    double rangeU, rangeV;
};

// Writes the entries of count pixels from column x on: u in the low and v in the high 16 bits, the
// position times 64, truncated and wrapped.
using QuadMapRow = void (*)(uint32_t* map, int32_t x, size_t count, const QuadMapRowPlan& plan);

KYV_FORMS(QuadMapRow, QuadMapRow)

extern const KernelTable<QuadMapRow> kQuadMapRow;

struct QuadCoordinates {
    double s;
    double t;
};

// s and t of a position, 0 to below 1: from 1 on they are 0.999. A solution that is not a number,
// of a quad without area, counts as 0.
QuadCoordinates SolveQuad(const QuadMapRowPlan& plan, double x);

// The entry of a position in pixels, both coordinates below +-2^25.
inline uint32_t MapEntry(double u, double v) {
    const auto value = [](double position) {
        return static_cast<uint32_t>(static_cast<int32_t>(position * 64.0)) & 0xFFFF;
    };
    return value(u) | value(v) << 16;
}

// The entry of column x.
inline uint32_t MapEntry(const QuadMapRowPlan& plan, double x) {
    const QuadCoordinates p = SolveQuad(plan, x);
    return MapEntry(plan.originU + p.s * plan.rangeU, plan.originV + p.t * plan.rangeV);
}

} // namespace kyv
