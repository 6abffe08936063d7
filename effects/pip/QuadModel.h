// The two models that map a quad of the frame onto a picture.
#pragma once

#include <cstdint>

#include "effects/pip/QuadMapRow.h"
#include "effects/pip/Rasterizer.h"

namespace kyv {

// Coordinates within +-2^24, where a float holds every whole number.
inline constexpr int32_t kFarthestPoint = 1 << 24;

// Where a position of the frame lies in the picture, in pixels. The scales are the local lengths of
// the quad's rows and columns over those of the picture, at most 1.
struct QuadPoint {
    bool inside;
    double u, v;
    float scaleU, scaleV;
};

class CQuadModel {
public:
    // The corners A, B, C, D of the quad and of the picture, all within +-kFarthestPoint.
    void Set(const RasterPointF (&quad)[4], const RasterPointF (&picture)[4]);

    // The inverse bilinear map of row y, with the picture at `scale` times its size. What the map
    // covers is everything: outside the quad the nearest edge of the picture, more or less.
    QuadMapRowPlan PlanRow(double y, double scale = 1.0) const;
    QuadPoint InverseBilinearPoint(double x, double y) const;

    // Wachspress coordinates: every corner's weight is the area of the triangle that it makes with
    // its neighbours over the product of those that the position makes with its two sides.
    // u = v = 1023 where they are not all positive: outside the quad, on its edges, and anywhere in
    // a quad that is not convex. It is also the last position that an entry can hold.
    QuadPoint WachspressPoint(double x, double y) const;

private:
    struct Vector {
        double x, y;
    };

    static double Cross(Vector a, Vector b) { return a.x * b.y - a.y * b.x; }
    static Vector Difference(RasterPointF a, RasterPointF b) {
        return {double{a.x} - b.x, double{a.y} - b.y};
    }
    void SetScales(QuadPoint& point, double s, double t) const;

    RasterPointF m_quad[4] = {};
    RasterPointF m_picture[4] = {};
    // Inverse bilinear: the vectors of QuadMapRow.h, and 1 for a quad whose corners run clockwise
    // on the screen, otherwise -1.
    Vector m_e = {}, m_f = {}, m_g = {};
    double m_orientation = 1.0;
    // Wachspress: signed areas, of the quad and of the triangle at every corner.
    double m_area = 0.0;
    double m_cornerArea[4] = {};
};

} // namespace kyv
