// The quad models.
#include "effects/pip/QuadModel.h"

#include <cmath>

namespace kyv {

void CQuadModel::Set(const RasterPointF (&quad)[4], const RasterPointF (&picture)[4]) {
    for (int i = 0; i < 4; ++i) {
        m_quad[i] = quad[i];
        m_picture[i] = picture[i];
    }
    m_e = Difference(quad[1], quad[0]);
    m_f = Difference(quad[3], quad[0]);
    const Vector dc = Difference(quad[2], quad[3]);
    m_g = {dc.x - m_e.x, dc.y - m_e.y};
    m_area = 0.5 * Cross(Difference(quad[2], quad[0]), Difference(quad[3], quad[1]));
    m_orientation = m_area < 0.0 ? -1.0 : 1.0;
    for (int i = 0; i < 4; ++i) {
        const RasterPointF& before = quad[(i + 3) % 4];
        m_cornerArea[i] =
            0.5 * Cross(Difference(quad[i], before), Difference(quad[(i + 1) % 4], before));
    }
}

// From h = s e + t f + s t g, crossed with what makes one of the two unknowns drop out:
//
//     (g x e) s^2 + (f x e + h x g) s + h x f = 0
//     (g x f) t^2 + (e x f + h x g) t + h x e = 0
//
// The derivatives at the solution are the Jacobian, negative for s and positive for t. The root
// with -sqrt needs it negative where the quad lies, which the orientation settles.
QuadMapRowPlan CQuadModel::PlanRow(double y, double scale) const {
    const double o = m_orientation;
    const double ax = m_quad[0].x;
    const double hy = y - m_quad[0].y;
    const double ef = Cross(m_e, m_f);
    // h x w along the row, for a constant w.
    const auto crossH = [&](Vector w) { return RowCoefficient{-ax * w.y - hy * w.x, w.y}; };
    const RowCoefficient hg = crossH(m_g);
    const RowCoefficient hf = crossH(m_f);
    const RowCoefficient he = crossH(m_e);
    const double as = o * Cross(m_g, m_e);
    const double at = -o * Cross(m_g, m_f);
    return {
        .twiceA_s = 2.0 * as,
        .twiceA_t = 2.0 * at,
        .fourA_t = 4.0 * at,
        .b_s = {o * (hg.base - ef), o * hg.step},
        .c_s = {o * hf.base, o * hf.step},
        .b_t = {-o * (hg.base + ef), -o * hg.step},
        .c_t = {-o * he.base, -o * he.step},
        .originU = scale * m_picture[0].x,
        .originV = scale * m_picture[0].y,
        .rangeU = scale * (double{m_picture[2].x} - m_picture[0].x),
        .rangeV = scale * (double{m_picture[2].y} - m_picture[0].y),
    };
}

QuadPoint CQuadModel::InverseBilinearPoint(double x, double y) const {
    const QuadMapRowPlan plan = PlanRow(y);
    const QuadCoordinates p = SolveQuad(plan, x);
    QuadPoint point = {true, plan.originU + p.s * plan.rangeU, plan.originV + p.t * plan.rangeV,
                       1.0F, 1.0F};
    SetScales(point, p.s, p.t);
    return point;
}

QuadPoint CQuadModel::WachspressPoint(double x, double y) const {
    double area[4]; // of the position and side i
    area[3] = m_area;
    for (int i = 0; i < 3; ++i) {
        const Vector p = {m_quad[i].x - x, m_quad[i].y - y};
        const Vector q = {m_quad[i + 1].x - x, m_quad[i + 1].y - y};
        area[i] = 0.5 * Cross(p, q);
        area[3] -= area[i];
    }
    double weight[4];
    double sum = 0.0;
    for (int i = 0; i < 4; ++i) {
        weight[i] = m_cornerArea[i] / (area[(i + 3) % 4] * area[i]);
        sum += weight[i];
    }
    // One step of Newton's after the exact reciprocal: approximate ones differ among processors.
    double reciprocal = 1.0 / sum;
    reciprocal = reciprocal * (2.0 - sum * reciprocal);
    QuadPoint point = {true, 0.0, 0.0, 1.0F, 1.0F};
    for (int i = 0; i < 4; ++i) {
        const double w = weight[i] * reciprocal;
        if (!(w > 0.0)) {
            return {false, 1023.0, 1023.0, 1.0F, 1.0F};
        }
        point.u += w * (m_picture[i].x + 0.5);
        point.v += w * (m_picture[i].y + 0.5);
    }
    SetScales(point, (point.u - m_picture[0].x) / (double{m_picture[2].x} - m_picture[0].x),
              (point.v - m_picture[0].y) / (double{m_picture[2].y} - m_picture[0].y));
    return point;
}

// The line of constant t through the point is |e + t g| long, and that of constant s |f + s g|.
void CQuadModel::SetScales(QuadPoint& point, double s, double t) const {
    const auto scale = [](double x, double y, double size) {
        const double ratio = std::sqrt(x * x + y * y) / std::fabs(size);
        return ratio < 1.0 ? static_cast<float>(ratio) : 1.0F;
    };
    point.scaleU =
        scale(m_e.x + t * m_g.x, m_e.y + t * m_g.y, double{m_picture[2].x} - m_picture[0].x);
    point.scaleV =
        scale(m_f.x + s * m_g.x, m_f.y + s * m_g.y, double{m_picture[2].y} - m_picture[0].y);
}

} // namespace kyv
