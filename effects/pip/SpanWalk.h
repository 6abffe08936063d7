// The walk behind the rasterizer's filled shapes: it yields runs of pixels, not pixels.
//
// The plain walks give exactly what the shapes are made of, in order. The walks over a window are
// for frames. They interpolate in 64 bits, so they differ from the plain ones only where those
// wrap, and their cost is bounded by the window's size, wherever the shape lies.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "effects/pip/Rasterizer.h"
#include "platform/WrapMath.h"

namespace kyv {

// A triangle's vertices by height.
struct TriangleOrder {
    RasterPoint top;
    RasterPoint middle;
    RasterPoint bottom;
};

// On equal heights these comparisons decide which vertex leads. A triangle without height takes its
// one span from the vertices that come out as top and middle.
constexpr TriangleOrder OrderByHeight(const RasterPoint (&v)[3]) {
    if (v[0].y >= v[1].y) {
        if (v[2].y < v[0].y) {
            return v[1].y < v[2].y ? TriangleOrder{v[1], v[2], v[0]}
                                   : TriangleOrder{v[2], v[1], v[0]};
        }
        return {v[1], v[0], v[2]};
    }
    if (v[2].y < v[1].y) {
        return v[0].y < v[2].y ? TriangleOrder{v[0], v[2], v[1]} : TriangleOrder{v[2], v[0], v[1]};
    }
    return {v[0], v[1], v[2]};
}

// emit(y, first, last) for every row of the triangle, first <= last.
template <class Emit>
void WalkTriangle(const RasterPoint (&vertices)[3], Emit&& emit) {
    // Wraps where 32 bits do not hold the products; a difference that wraps to -1 must not meet the
    // one quotient that does not fit.
    constexpr auto interpolate = [](RasterPoint from, RasterPoint to, int32_t y) {
        const int32_t sum =
            WrapAdd(WrapMul(to.x, WrapSub(y, from.y)), WrapMul(from.x, WrapSub(to.y, y)));
        switch (const int32_t height = WrapSub(to.y, from.y)) {
        case 0:
            return to.x;
        case -1:
            return WrapSub(0, sum);
        default:
            return sum / height;
        }
    };
    const TriangleOrder t = OrderByHeight(vertices);
    for (int64_t row = t.top.y; row <= t.bottom.y; ++row) {
        const auto y = static_cast<int32_t>(row);
        int32_t a = t.middle.x;
        int32_t b = t.top.x;
        if (y > t.middle.y) {
            a = interpolate(t.middle, t.bottom, y);
            b = interpolate(t.top, t.bottom, y);
        } else if (t.middle.y != t.top.y) {
            a = interpolate(t.top, t.middle, y);
            b = interpolate(t.top, t.bottom, y);
        }
        emit(y, std::min(a, b), std::max(a, b));
    }
}

// emit(below, above, first, last) for every pair of rows of a disc: the row below the centre and
// the one as far above it. They are one row at the centre, and rows where the two families of spans
// meet come more than once.
template <class Emit>
void WalkCircle(RasterPoint centre, int32_t radius, Emit&& emit) {
    if (radius < 1) {
        return;
    }
    const int64_t x = centre.x;
    const int64_t y = centre.y;
    int64_t u = 0;
    int64_t v = radius;
    int64_t decision = 3 - 2 * v;
    while (u <= v) {
        emit(y + v, y - v, x - u, x + u);
        emit(y + u, y - u, x - v, x + v);
        if (decision >= 0) {
            decision += 4 * (u - v) + 10;
            --v;
        } else {
            decision += 4 * u + 6;
        }
        ++u;
    }
}

// One side of a triangle: the column in every row, rising or falling all the way down.
class CTriangleSide {
public:
    constexpr CTriangleSide(RasterPoint from, RasterPoint to)
        : m_fromX(from.x), m_fromY(from.y), m_toX(to.x), m_toY(to.y) {}

    // A side without height is at its second end, where the walk's rules want it.
    constexpr int64_t At(int64_t y) const {
        const int64_t height = m_toY - m_fromY;
        return height == 0 ? m_toX : (m_toX * (y - m_fromY) + m_fromX * (m_toY - y)) / height;
    }

    // At most one column from row to row.
    constexpr bool IsSteep() const {
        const int64_t width = m_toX > m_fromX ? m_toX - m_fromX : m_fromX - m_toX;
        return width <= m_toY - m_fromY;
    }

private:
    int64_t m_fromX;
    int64_t m_fromY;
    int64_t m_toX;
    int64_t m_toY;
};

class CWindowWalk {
public:
    explicit CWindowWalk(const RasterWindow& window) : m_window(window) {}

    // emit(y, first, last) for the part of every span that is inside.
    template <class Emit>
    void ClipTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        ForHalves(vertices, [&](const CTriangleSide& a, const CTriangleSide& b, int64_t top,
                                int64_t bottom) {
            const int64_t end = std::min<int64_t>(bottom, m_window.bottom);
            for (int64_t y = std::max<int64_t>(top, m_window.top); y <= end; ++y) {
                EmitInside(y, std::min(a.At(y), b.At(y)), std::max(a.At(y), b.At(y)), emit);
            }
        });
    }

    template <class Emit>
    void ClipCircle(RasterPoint centre, int32_t radius, Emit&& emit) const {
        WalkCircle(centre, radius, [&](int64_t below, int64_t above, int64_t first, int64_t last) {
            for (const int64_t y : {below, above}) {
                if (y >= m_window.top && y <= m_window.bottom) {
                    EmitInside(y, first, last, emit);
                }
            }
        });
    }

    // emit(y, first, last) for spans that together are the shape with every position outside moved
    // to the nearest one inside. Rows come top to bottom.
    template <class Emit>
    void ClampQuad(const RasterPoint (&quad)[4], Emit&& emit) const {
        ClampTriangles({{quad[0], quad[1], quad[2]}, {quad[0], quad[2], quad[3]}}, emit);
    }

    template <class Emit>
    void ClampTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        ClampTriangles({{vertices[0], vertices[1], vertices[2]}}, emit);
    }

private:
    // The rows of a triangle above or below its middle vertex.
    struct Half {
        CTriangleSide a;
        CTriangleSide b;
        int64_t top;
        int64_t bottom;
    };

    template <size_t N, class Emit>
    void ClampTriangles(const RasterPoint (&triangles)[N][3], Emit&& emit) const {
        std::vector<Half> halves;
        halves.reserve(2 * N);
        int64_t first = m_window.bottom;
        int64_t last = m_window.top;
        for (const auto& vertices : triangles) {
            ForHalves(vertices, [&](const CTriangleSide& a, const CTriangleSide& b, int64_t top,
                                    int64_t bottom) {
                halves.push_back({a, b, top, bottom});
                first = std::min(first, top);
                last = std::max(last, bottom);
            });
        }
        first = std::max<int64_t>(first, m_window.top);
        last = std::min<int64_t>(last, m_window.bottom);
        for (int64_t y = first; y <= last; ++y) {
            for (const Half& half : halves) {
                ClampRow(half, y, emit);
            }
        }
    }

    template <class Emit>
    void ClampRow(const Half& half, int64_t y, Emit&& emit) const {
        const auto target = static_cast<int32_t>(y);
        if (y == m_window.top) {
            Collapse(half.a, half.b, half.top, std::min(half.bottom, y - 1), target, emit);
        }
        if (y >= half.top && y <= half.bottom) {
            const Columns row = Hull(half.a, half.b, y, y);
            emit(target, row.first, row.last);
        }
        if (y == m_window.bottom) {
            Collapse(half.a, half.b, std::max(half.top, y + 1), half.bottom, target, emit);
        }
    }

    // half(a, b, top, bottom): the sides and rows above and below the middle vertex.
    template <class Half>
    static void ForHalves(const RasterPoint (&vertices)[3], Half&& half) {
        const TriangleOrder t = OrderByHeight(vertices);
        if (t.middle.y == t.top.y) {
            // The one row lies between these two, wherever the third vertex is.
            half(CTriangleSide(t.middle, t.middle), CTriangleSide(t.top, t.top), t.top.y, t.top.y);
        } else {
            half(CTriangleSide(t.top, t.middle), CTriangleSide(t.top, t.bottom), t.top.y,
                 t.middle.y);
        }
        half(CTriangleSide(t.middle, t.bottom), CTriangleSide(t.top, t.bottom),
             int64_t{t.middle.y} + 1, t.bottom.y);
    }

    int32_t Clamp(int64_t x) const {
        return static_cast<int32_t>(std::clamp<int64_t>(x, m_window.left, int64_t{m_window.right}));
    }

    // The last row up to `last` in which a side is still in the clamped column of row y.
    int64_t LastRowAlike(const CTriangleSide& side, int64_t y, int64_t last) const {
        const int32_t column = Clamp(side.At(y));
        int64_t alike = y;
        while (alike < last) {
            const int64_t middle = alike + (last - alike + 1) / 2;
            if (Clamp(side.At(middle)) == column) {
                alike = middle;
            } else {
                last = middle - 1;
            }
        }
        return alike;
    }

    // Draws the rows top to bottom onto the one row of the window that is nearest to them. Rows in
    // which no side moves by more than a column a step leave no gap between their spans, so their
    // union is known from the first and the last; sides that move faster are through the window
    // within as many rows as it has columns. Hulls that meet are one span: as sides do not turn
    // round, what comes after a gap never comes back, and no column is in two spans.
    template <class Emit>
    void Collapse(const CTriangleSide& a, const CTriangleSide& b, int64_t top, int64_t bottom,
                  int32_t target, Emit&& emit) const {
        if (top > bottom) {
            return;
        }
        Columns pending = Hull(a, b, top, top);
        for (int64_t y = top; y <= bottom;) {
            int64_t end = bottom;
            for (const CTriangleSide* side : {&a, &b}) {
                if (!side->IsSteep()) {
                    end = LastRowAlike(*side, y, end);
                }
            }
            const Columns hull = Hull(a, b, y, end);
            if (hull.first > pending.last + 1 || hull.last < pending.first - 1) {
                emit(target, pending.first, pending.last);
                pending = hull;
            } else {
                pending = {std::min(pending.first, hull.first), std::max(pending.last, hull.last)};
            }
            y = end + 1;
        }
        emit(target, pending.first, pending.last);
    }

    // Both ends inside.
    struct Columns {
        int32_t first;
        int32_t last;
    };

    Columns Hull(const CTriangleSide& a, const CTriangleSide& b, int64_t top,
                 int64_t bottom) const {
        const int32_t a0 = Clamp(a.At(top));
        const int32_t b0 = Clamp(b.At(top));
        const int32_t a1 = top == bottom ? a0 : Clamp(a.At(bottom));
        const int32_t b1 = top == bottom ? b0 : Clamp(b.At(bottom));
        return {std::min({a0, b0, a1, b1}), std::max({a0, b0, a1, b1})};
    }

    template <class Emit>
    void EmitInside(int64_t y, int64_t first, int64_t last, Emit&& emit) const {
        first = std::max<int64_t>(first, m_window.left);
        last = std::min<int64_t>(last, m_window.right);
        if (first <= last) {
            emit(static_cast<int32_t>(y), static_cast<int32_t>(first), static_cast<int32_t>(last));
        }
    }

    RasterWindow m_window;
};

} // namespace kyv
