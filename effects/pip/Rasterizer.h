// Turns points, lines, circles, triangles and quads into a stream of pixel positions.
//
// A pixel is emitted or it is not: there is no sub-pixel precision and no coverage. Spans include
// both of their ends and shapes their last row, so shapes that share an edge both emit it, and some
// primitives emit a pixel twice. What a pixel means is the receiver's affair; it must put up with
// repeats.
//
// Every primitive hands all its pixels to the one callback that the process has when the primitive
// is called. It is null at first and stays until it is replaced; without one nothing is emitted.
// The callback is not guarded, so drawing is one thread's affair at a time. Frames are drawn by
// whole spans and without any state shared by the process, on the walks of effects/pip/SpanWalk.h,
// on which the primitives stand too.
#pragma once

#include <cstdint>

#include "platform/Truncate.h"

namespace kyv {

struct RasterPoint {
    int32_t x;
    int32_t y;

    bool operator==(const RasterPoint&) const = default;
};

struct RasterPointF {
    float x;
    float y;
};

struct RasterPixel {
    int32_t x;
    int32_t y;
    uint32_t attributes[10]; // zero
    RasterPoint vertices[3]; // of a filled triangle, in the caller's order; otherwise zero
};

using RasterPixelCallback = void (*)(const RasterPixel* pixel);

class CRasterizer {
public:
    virtual ~CRasterizer() = default;

    static void SetPixelCallback(RasterPixelCallback callback);

    static void PlotPixel(int32_t x, int32_t y);

    // Bresenham, both end points included. Where both distances are equal x is the major axis.
    static void DrawLine(int32_t x0, int32_t y0, int32_t x1, int32_t y1);

    // A midpoint disc; nothing for a radius below 1. Some rows are emitted more than once.
    static void FillCircle(int32_t centreX, int32_t centreY, int32_t radius);

    // Rows top to bottom, left to right in a row. Nothing if a pointer is null. Positions are
    // interpolated in 32 bits, so they are exact while a coordinate times the triangle's height
    // stays below 2^31; beyond, the products wrap.
    static void FillTriangle(const RasterPoint* a, const RasterPoint* b, const RasterPoint* c);

    // The triangles ABC and ACD, each only when all three of its points are there.
    static void FillQuad(const RasterPoint* a, const RasterPoint* b, const RasterPoint* c,
                         const RasterPoint* d);

    // Points are truncated toward zero. Values beyond 32 bits go to the nearest end of them, and
    // those that are not a number to 0.
    static void FillTriangleF(const RasterPointF* a, const RasterPointF* b, const RasterPointF* c);

    // FillQuad of points that are truncated like those of FillTriangleF.
    static void FillQuadF(const RasterPointF* a, const RasterPointF* b, const RasterPointF* c,
                          const RasterPointF* d);

    // The points (+-u, +-v) and (+-v, +-u) about the centre; those that coincide are repeated.
    static void PlotEightWay(int32_t centreX, int32_t centreY, int32_t u, int32_t v);
    // The outline of a midpoint circle in eight-way points; radius 0 is the centre, and nothing for
    // a negative one.
    static void DrawCircle(int32_t centreX, int32_t centreY, int32_t radius);
    // The outline of an ellipse by its half axes; nothing when one is negative or beyond 2^19.
    static void DrawEllipse(int32_t centreX, int32_t centreY, int32_t radiusX, int32_t radiusY);
};

inline RasterPoint Truncate(const RasterPoint& point) {
    return point;
}
inline RasterPoint Truncate(const RasterPointF& point) {
    return {TruncateToInt(point.x), TruncateToInt(point.y)};
}

} // namespace kyv
