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
#include "effects/pip/SpanRows.h"
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

// take(a, b, top, bottom) for the rows of a triangle above and then below its middle vertex, both
// ends inside, with the sides that they lie between.
template <class Side, class Take>
void WalkHalves(const RasterPoint (&vertices)[3], Take&& take) {
    const TriangleOrder t = OrderByHeight(vertices);
    if (t.top.y == t.middle.y) {
        // The one row lies between these two, wherever the third vertex is.
        take(Side(t.middle, t.middle), Side(t.top, t.top), t.top.y, t.top.y);
    } else {
        take(Side(t.top, t.middle), Side(t.top, t.bottom), t.top.y, t.middle.y);
    }
    take(Side(t.middle, t.bottom), Side(t.top, t.bottom), int64_t{t.middle.y} + 1, t.bottom.y);
}

// A side whose products wrap where 32 bits do not hold them.
class CWrappingSide {
public:
    CWrappingSide(RasterPoint from, RasterPoint to) : m_from(from), m_to(to) {}

    int32_t At(int32_t y) const {
        const int32_t height = WrapSub(m_to.y, m_from.y);
        const int32_t sum =
            WrapAdd(WrapMul(m_to.x, WrapSub(y, m_from.y)), WrapMul(m_from.x, WrapSub(m_to.y, y)));
        // A height that wraps to -1 must not meet the one quotient that does not fit.
        return height == 0 ? m_to.x : height == -1 ? WrapSub(0, sum) : sum / height;
    }

private:
    RasterPoint m_from;
    RasterPoint m_to;
};

// emit(y, first, last) for every row of the triangle, first <= last.
template <class Emit>
void WalkTriangle(const RasterPoint (&vertices)[3], Emit&& emit) {
    WalkHalves<CWrappingSide>(
        vertices, [&](const CWrappingSide& a, const CWrappingSide& b, int64_t top, int64_t bottom) {
            for (int64_t row = top; row <= bottom; ++row) {
                const auto y = static_cast<int32_t>(row);
                emit(y, std::min(a.At(y), b.At(y)), std::max(a.At(y), b.At(y)));
            }
        });
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

// Walks over a window, which must not be empty.
class CWindowWalk {
public:
    explicit CWindowWalk(const PixelBox& window)
        : m_top(window.top), m_bottom(window.bottom - 1), m_columns{window.left, window.right - 1} {
    }

    // emit(y, first, last) for the part of every span that is inside.
    template <class Emit>
    void ClipTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        ForHalves(vertices, [&](const TriangleHalf& half) {
            for (int64_t y = std::max(half.top, m_top); y <= std::min(half.bottom, m_bottom); ++y) {
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
                if (y >= m_top && y <= m_bottom) {
                    EmitInside(y, first, last, emit);
                }
            }
        });
    }

    // emit(y, first, last) for spans that together are the triangle with every position outside
    // moved to the nearest one inside.
    template <class Emit>
    void ClampTriangle(const RasterPoint (&vertices)[3], Emit&& emit) const {
        ForHalves(vertices, [&](const TriangleHalf& half) {
            const auto collapse = [&](int64_t top, int64_t bottom, int64_t target) {
                Collapse(half, top, bottom, m_columns,
                         [&](Columns c) { emit(static_cast<int32_t>(target), c.first, c.last); });
            };
            collapse(half.top, std::min(half.bottom, m_top - 1), m_top);
            for (int64_t y = std::max(half.top, m_top); y <= std::min(half.bottom, m_bottom); ++y) {
                const Columns row = half.Hull(y, y, m_columns);
                emit(static_cast<int32_t>(y), row.first, row.last);
            }
            collapse(std::max(half.top, m_bottom + 1), half.bottom, m_bottom);
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
        WalkHalves<CTriangleSide>(vertices, [&](const CTriangleSide& a, const CTriangleSide& b,
                                                int64_t top, int64_t bottom) {
            take(TriangleHalf{a, b, top, bottom});
        });
    }

    template <class Emit>
    void EmitInside(int64_t y, int64_t first, int64_t last, Emit&& emit) const {
        first = std::max<int64_t>(first, m_columns.first);
        last = std::min<int64_t>(last, m_columns.last);
        if (first <= last) {
            emit(static_cast<int32_t>(y), static_cast<int32_t>(first), static_cast<int32_t>(last));
        }
    }

    int64_t m_top;
    int64_t m_bottom; // inside
    Columns m_columns;
};

} // namespace kyv
