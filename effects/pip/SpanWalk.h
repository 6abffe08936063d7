// The walk behind the rasterizer's filled shapes: it yields runs of pixels, not pixels.
//
// The plain walks give exactly what the shapes are made of, in order. The walks over a window are
// for frames. They interpolate in 64 bits, so they differ from the plain ones only where those
// wrap, and their cost is bounded by the window's size, wherever the shape lies.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>

#include "effects/pip/Rasterizer.h"
#include "effects/pip/SpanCollapse.h"
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

class CWindowWalk {
public:
    explicit CWindowWalk(const RasterWindow& window) : m_window(window) {}

    // emit(y, first, last) for the part of every span that is inside.
    template <class Emit>
    void ClipTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        ForHalves(vertices, [&](const TriangleHalf& half) {
            const int64_t end = std::min<int64_t>(half.bottom, m_window.bottom);
            for (int64_t y = std::max<int64_t>(half.top, m_window.top); y <= end; ++y) {
                const int64_t a = half.a.At(y);
                const int64_t b = half.b.At(y);
                EmitInside(y, std::min(a, b), std::max(a, b), emit);
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

    // emit(y, first, last) for spans that together are the triangle with every position outside
    // moved to the nearest one inside.
    template <class Emit>
    void ClampTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        const Columns window = {m_window.left, m_window.right};
        ForHalves(vertices, [&](const TriangleHalf& half) {
            const auto collapse = [&](int64_t top, int64_t bottom, int32_t target) {
                Collapse(half, top, bottom, window,
                         [&](Columns c) { emit(target, c.first, c.last); });
            };
            collapse(half.top, std::min<int64_t>(half.bottom, int64_t{m_window.top} - 1),
                     m_window.top);
            const int64_t end = std::min<int64_t>(half.bottom, m_window.bottom);
            for (int64_t y = std::max<int64_t>(half.top, m_window.top); y <= end; ++y) {
                const Columns row = half.Hull(y, y, window);
                emit(static_cast<int32_t>(y), row.first, row.last);
            }
            collapse(std::max<int64_t>(half.top, int64_t{m_window.bottom} + 1), half.bottom,
                     m_window.bottom);
        });
    }

    // The triangles ABC and ACD.
    template <class Emit>
    void ClampQuad(const RasterPoint (&quad)[4], Emit&& emit) const {
        ClampTriangle({quad[0], quad[1], quad[2]}, emit);
        ClampTriangle({quad[0], quad[2], quad[3]}, emit);
    }

private:
    template <class Take>
    static void ForHalves(const RasterPoint (&vertices)[3], Take&& take) {
        const TriangleOrder t = OrderByHeight(vertices);
        const auto side = [](RasterPoint from, RasterPoint to) {
            return CTriangleSide({from.x, from.y}, {to.x, to.y});
        };
        if (t.middle.y == t.top.y) {
            // The one row lies between these two, wherever the third vertex is.
            take({side(t.middle, t.middle), side(t.top, t.top), t.top.y, t.top.y});
        } else {
            take({side(t.top, t.middle), side(t.top, t.bottom), t.top.y, t.middle.y});
        }
        take(
            {side(t.middle, t.bottom), side(t.top, t.bottom), int64_t{t.middle.y} + 1, t.bottom.y});
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
