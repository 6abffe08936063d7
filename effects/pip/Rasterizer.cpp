// The rasterizer's primitives, pixel by pixel.
#include "effects/pip/Rasterizer.h"

#include "effects/pip/SpanWalk.h"

namespace kyv {
namespace {

RasterPixelCallback g_callback = nullptr;

// What a primitive draws with: the callback that it found, to which it keeps when the callback
// installs another. Every pixel has a fresh record, so that the callback does not change the next
// one.
class CPen {
public:
    void Plot(int64_t x, int64_t y) const {
        RasterPixel pixel = {};
        Emit(pixel, x, y);
    }

    template <class Point>
    void FillTriangle(const Point* a, const Point* b, const Point* c) const {
        if (!a || !b || !c) {
            return;
        }
        const RasterPoint vertices[3] = {Truncate(*a), Truncate(*b), Truncate(*c)};
        WalkTriangle(vertices, [&](int32_t y, int32_t first, int32_t last) {
            for (int64_t x = first; x <= last; ++x) {
                RasterPixel pixel = {0, 0, {}, {vertices[0], vertices[1], vertices[2]}};
                Emit(pixel, x, y);
            }
        });
    }

    template <class Point>
    void FillQuad(const Point* a, const Point* b, const Point* c, const Point* d) const {
        FillTriangle(a, b, c);
        FillTriangle(a, c, d);
    }

    // (+-u, +-v) about the centre.
    void PlotFourWay(int64_t x, int64_t y, int64_t u, int64_t v) const {
        Plot(x + u, y + v);
        Plot(x - u, y + v);
        Plot(x + u, y - v);
        Plot(x - u, y - v);
    }

    void PlotEightWay(int64_t x, int64_t y, int64_t u, int64_t v) const {
        PlotFourWay(x, y, u, v);
        PlotFourWay(x, y, v, u);
    }

private:
    void Emit(RasterPixel& pixel, int64_t x, int64_t y) const {
        if (m_callback) {
            pixel.x = static_cast<int32_t>(x);
            pixel.y = static_cast<int32_t>(y);
            m_callback(&pixel);
        }
    }

    const RasterPixelCallback m_callback = g_callback;
};

} // namespace

void CRasterizer::SetPixelCallback(RasterPixelCallback callback) {
    g_callback = callback;
}

void CRasterizer::PlotPixel(int32_t x, int32_t y) {
    CPen().Plot(x, y);
}

void CRasterizer::DrawLine(int32_t x0, int32_t y0, int32_t x1, int32_t y1) {
    const CPen pen;
    int64_t x = x0;
    int64_t y = y0;
    const int64_t dx = std::abs(int64_t{x1} - x0);
    const int64_t dy = std::abs(int64_t{y1} - y0);
    const int64_t stepX = x1 < x0 ? -1 : 1;
    const int64_t stepY = y1 < y0 ? -1 : 1;
    if (dx < dy) {
        for (int64_t error = 2 * dx - dy; y != y1; y += stepY, error += 2 * dx) {
            pen.Plot(x, y);
            if (error >= 0) {
                x += stepX;
                error -= 2 * dy;
            }
        }
    } else {
        for (int64_t error = 2 * dy - dx; x != x1; x += stepX, error += 2 * dy) {
            pen.Plot(x, y);
            if (error >= 0) {
                y += stepY;
                error -= 2 * dx;
            }
        }
    }
    pen.Plot(x, y);
}

void CRasterizer::FillCircle(int32_t centreX, int32_t centreY, int32_t radius) {
    const CPen pen;
    WalkCircle({centreX, centreY}, radius,
               [&](int64_t below, int64_t above, int64_t first, int64_t last) {
                   for (int64_t x = first; x <= last; ++x) {
                       pen.Plot(x, below);
                       pen.Plot(x, above);
                   }
               });
}

void CRasterizer::FillTriangle(const RasterPoint* a, const RasterPoint* b, const RasterPoint* c) {
    CPen().FillTriangle(a, b, c);
}

void CRasterizer::FillQuad(const RasterPoint* a, const RasterPoint* b, const RasterPoint* c,
                           const RasterPoint* d) {
    CPen().FillQuad(a, b, c, d);
}

void CRasterizer::FillTriangleF(const RasterPointF* a, const RasterPointF* b,
                                const RasterPointF* c) {
    CPen().FillTriangle(a, b, c);
}

void CRasterizer::FillQuadF(const RasterPointF* a, const RasterPointF* b, const RasterPointF* c,
                            const RasterPointF* d) {
    CPen().FillQuad(a, b, c, d);
}

void CRasterizer::PlotEightWay(int32_t centreX, int32_t centreY, int32_t u, int32_t v) {
    CPen().PlotEightWay(centreX, centreY, u, v);
}

void CRasterizer::DrawCircle(int32_t centreX, int32_t centreY, int32_t radius) {
    if (radius < 0) {
        return;
    }
    const CPen pen;
    // The same decisions as the disc's, so that the outline is its rim.
    int64_t u = 0;
    int64_t v = radius;
    int64_t decision = 3 - 2 * v;
    for (; u <= v; ++u) {
        pen.PlotEightWay(centreX, centreY, u, v);
        if (decision >= 0) {
            decision += 4 * (u - v) + 10;
            --v;
        } else {
            decision += 4 * u + 6;
        }
    }
}

void CRasterizer::DrawEllipse(int32_t centreX, int32_t centreY, int32_t radiusX, int32_t radiusY) {
    constexpr int32_t kLongest = 1 << 19; // its cubes are what 64 bits hold
    if (radiusX < 0 || radiusY < 0 || radiusX > kLongest || radiusY > kLongest) {
        return;
    }
    const int64_t a2 = int64_t{radiusX} * radiusX;
    const int64_t b2 = int64_t{radiusY} * radiusY;
    const CPen pen;
    // From the left end to the top: error is b2 x^2 + a2 y^2 - a2 b2 at the point one step further
    // along both axes, which says which of the two steps comes nearer to the curve.
    int64_t x = -int64_t{radiusX};
    int64_t y = 0;
    int64_t stepX = b2 * (1 + 2 * x);
    int64_t stepY = a2;
    int64_t error = stepX + stepY;
    while (x <= 0) {
        pen.PlotFourWay(centreX, centreY, x, y);
        const int64_t twice = 2 * error;
        if (twice >= stepX) {
            ++x;
            stepX += 2 * b2;
            error += stepX;
        }
        if (twice <= stepY) {
            ++y;
            stepY += 2 * a2;
            error += stepY;
        }
    }
    // A flat ellipse reaches its middle before its top.
    for (; y < radiusY; ++y) {
        pen.Plot(centreX, centreY + y + 1);
        pen.Plot(centreX, centreY - y - 1);
    }
}

} // namespace kyv
