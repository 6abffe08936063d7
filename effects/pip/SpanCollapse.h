// The rows of a triangle's half that lie above or below a window, drawn onto its nearest row.
//
// Thousands of rows can end up on one another, and drawing each would cost their number times the
// window's width. Collapse gives the union of their spans at the cost of the width alone. Why that
// is exact, with a(y) and b(y) the columns of the half's two sides, clamped to the window:
//
// 1. Both are monotonic, rising or falling all the way down: the truncation of a linear function,
//    and then a clamp, keep the order of values.
// 2. A side that is no wider than it is high moves by at most one column from row to row: values of
//    the linear function that lie at most 1 apart truncate to columns at most 1 apart.
// 3. Take rows in which no side moves by more than a column a step: the steep ones of 2 move so by
//    themselves, of the others only rows with one and the same column are taken. Then the spans of
//    neighbouring rows touch, as each end lies at most a column from one of the span before, and
//    their union is one span. By 1 its ends are among the four columns of the first and the last
//    row. That is Hull.
// 4. Each further stretch of such rows begins where a side that is not steep has left a column,
//    to which by 1 it never returns. So there are at most two stretches a column, whatever the
//    number of rows; the end of each is found by bisection, which 1 allows.
// 5. Hulls that touch are joined. After a gap both sides are beyond it, on the same side of it, and
//    by 1 they stay there: no column comes twice.
#pragma once

#include <algorithm>
#include <cstdint>

#include "effects/pip/Rasterizer.h"

namespace kyv {

// One side of a triangle: the column in every row, rising or falling all the way down.
class CTriangleSide {
public:
    constexpr CTriangleSide(RasterPoint from, RasterPoint to) : m_from(from), m_to(to) {}

    // A side without height is at its second end, where the walk's rules want it.
    constexpr int64_t At(int64_t y) const {
        const int64_t height = int64_t{m_to.y} - m_from.y;
        return height == 0 ? m_to.x : (m_to.x * (y - m_from.y) + m_from.x * (m_to.y - y)) / height;
    }

    // At most one column from row to row.
    constexpr bool IsSteep() const {
        const int64_t width = int64_t{m_to.x} - m_from.x;
        return std::max(width, -width) <= int64_t{m_to.y} - m_from.y;
    }

private:
    RasterPoint m_from;
    RasterPoint m_to;
};

// Columns left to right, both ends inside.
struct Columns {
    int32_t first;
    int32_t last;

    constexpr int32_t Clamp(int64_t x) const {
        return static_cast<int32_t>(std::clamp<int64_t>(x, first, last));
    }
};

// The rows of a triangle above or below its middle vertex, top to bottom, both inside.
struct TriangleHalf {
    CTriangleSide a;
    CTriangleSide b;
    int64_t top;
    int64_t bottom;

    // What the spans of two rows and, where they leave no gaps, of all between them cover.
    constexpr Columns Hull(int64_t from, int64_t to, Columns window) const {
        const int32_t a0 = window.Clamp(a.At(from));
        const int32_t b0 = window.Clamp(b.At(from));
        const int32_t a1 = from == to ? a0 : window.Clamp(a.At(to));
        const int32_t b1 = from == to ? b0 : window.Clamp(b.At(to));
        return {std::min({a0, b0, a1, b1}), std::max({a0, b0, a1, b1})};
    }
};

// emit(columns) for the union of the spans of the half's rows from `top` to `bottom`, clamped to
// the window: left to right or right to left, none of them touching another.
template <class Emit>
void Collapse(const TriangleHalf& half, int64_t top, int64_t bottom, Columns window, Emit&& emit) {
    if (top > bottom) {
        return;
    }
    const auto lastRowAlike = [&](const CTriangleSide& side, int64_t y, int64_t last) {
        const int32_t column = window.Clamp(side.At(y));
        int64_t alike = y;
        while (alike < last) {
            const int64_t middle = alike + (last - alike + 1) / 2;
            if (window.Clamp(side.At(middle)) == column) {
                alike = middle;
            } else {
                last = middle - 1;
            }
        }
        return alike;
    };
    Columns pending = half.Hull(top, top, window);
    for (int64_t y = top; y <= bottom;) {
        int64_t end = bottom;
        for (const CTriangleSide* side : {&half.a, &half.b}) {
            if (!side->IsSteep()) {
                end = lastRowAlike(*side, y, end);
            }
        }
        const Columns hull = half.Hull(y, end, window);
        if (hull.first > pending.last + 1 || hull.last < pending.first - 1) {
            emit(pending);
            pending = hull;
        } else {
            pending = {std::min(pending.first, hull.first), std::max(pending.last, hull.last)};
        }
        y = end + 1;
    }
    emit(pending);
}

} // namespace kyv
