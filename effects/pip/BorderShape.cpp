// The shape of a border: bands, wedges and discs.
#include "effects/pip/BorderShape.h"

#include <cmath>

#include "effects/pip/SpanWalk.h"

namespace kyv {
namespace {

// A side's unit normal; no direction for a side without length.
RasterPointF UnitNormal(RasterPoint from, RasterPoint to) {
    const auto dx = static_cast<float>(to.x - from.x);
    const auto dy = static_cast<float>(to.y - from.y);
    const float square = dx * dx + dy * dy;
    if (square == 0.0F) {
        return {0.0F, 0.0F};
    }
    // One step of Newton's after the exact root: approximate ones differ among processors.
    float r = 1.0F / std::sqrt(square);
    r = r * (square * r * r - 3.0F) * -0.5F;
    return {dy * r, -dx * r};
}

RasterPoint Offset(RasterPoint point, RasterPointF normal, float by) {
    return Truncate(RasterPointF{static_cast<float>(point.x) + normal.x * by,
                                 static_cast<float>(point.y) + normal.y * by});
}

// The normal of the nearest side that has length, from one side on forwards (step 1) or backwards
// (step 3): at a double corner the sides beyond it are those that join.
const RasterPointF& JoinedNormal(const RasterPointF (&normals)[4], int side, int step) {
    for (int i = 0; i < 3 && normals[side].x == 0.0F && normals[side].y == 0.0F; ++i) {
        side = (side + step) % 4;
    }
    return normals[side];
}

} // namespace

PixelBox BorderShape::Box() const {
    constexpr int32_t kFarthest = 99999;
    PixelBox box = {};
    for (const RasterPoint& corner : corners) {
        const int32_t x = std::min(corner.x, kFarthest);
        const int32_t y = std::min(corner.y, kFarthest);
        box = box.About({x, y, x + 1, y + 1});
    }
    return box;
}

void AddBorderShape(CSpanRows& spans, const BorderShape& shape) {
    if (shape.size < 0) {
        return;
    }
    const CWindowWalk walk({0, 0, shape.width, shape.height});
    const auto add = [&](int32_t y, int32_t first, int32_t last) { spans.Add(y, first, last); };
    const auto& quad = shape.corners;
    const int32_t wholeHalf = shape.size / 2;
    const auto half = static_cast<float>(wholeHalf);
    RasterPointF normals[4];
    for (int i = 0; i < 4; ++i) {
        normals[i] = UnitNormal(quad[i], quad[(i + 1) % 4]);
    }
    for (int i = 0; i < 4; ++i) {
        const RasterPoint from = quad[i];
        const RasterPoint to = quad[(i + 1) % 4];
        const RasterPoint band[4] = {Offset(from, normals[i], half), Offset(to, normals[i], half),
                                     Offset(to, normals[i], -half),
                                     Offset(from, normals[i], -half)};
        walk.ClipTriangle({band[0], band[1], band[2]}, add);
        walk.ClipTriangle({band[0], band[2], band[3]}, add);
        // The bands' ends part on the outer side of the turn: to the left of a turn to the right.
        const RasterPointF& before = JoinedNormal(normals, (i + 3) % 4, 3);
        const RasterPointF& after = JoinedNormal(normals, i, 1);
        const float turn = before.x * after.y - before.y * after.x;
        const float side = turn < 0.0F ? -half : half;
        walk.ClipTriangle({from, Offset(from, before, side), Offset(from, after, side)}, add);
        walk.ClipCircle(from, wholeHalf - 1, add);
    }
}

} // namespace kyv
