// Passes over the layers.
#include "effects/pip/PipLayers.h"

#include <cmath>
#include <cstring>

#include "effects/pip/LayerRows.h"
#include "effects/pip/SpanWalk.h"
#include "platform/CpuFeatures.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

uint8_t* At(const CImageARGB& image, int32_t x, int32_t y) {
    return image.Row(y) + ptrdiff_t{4} * x;
}

template <class Function>
Function FormFor(const KernelTable<Function>& table, const CImageARGB& image) {
    return table.For(Resolve(image.GetCpuLevel()));
}

} // namespace

void CPipLayer::Reset(const CImageARGB& frame, bool ayuv, uint32_t clear) {
    if (!m_image.GetBuffer() || !m_image.IsSameSize(frame)) {
        m_used = {};
        m_image.Create(frame.GetWidth(), frame.GetHeight());
        m_used = Frame();
    } else if (ayuv != m_bAyuv) {
        m_used = Frame();
    }
    m_bAyuv = ayuv;
    m_bFresh = true;
    m_image.SetCpuLevel(frame.GetCpuLevel());
    m_pBlendRow = FormFor(kAlphaBlend, m_image);
    for (int32_t y = m_used.top; y < m_used.bottom; ++y) {
        auto* row = reinterpret_cast<uint32_t*>(At(m_image, m_used.left, y));
        std::fill_n(row, std::max(m_used.Width(), 0), clear);
    }
    m_used = {};
}

bool CPipLayer::Fits(const CImageARGB& frame, bool ayuv) const {
    return m_image.GetBuffer() && m_image.IsSameSize(frame) && ayuv == m_bAyuv && m_bFresh &&
           m_image.GetCpuLevel() == frame.GetCpuLevel();
}

void CPipLayer::Stamp(const CPipLayer& layer, int32_t dx, int32_t dy, uint32_t pixel) {
    const PixelBox box = layer.m_used.Moved(dx, dy).CutTo(m_used);
    if (box.IsEmpty()) {
        return;
    }
    const StampRow stamp = FormFor(kStampRow, m_image);
    for (int32_t y = box.top; y < box.bottom; ++y) {
        stamp(At(m_image, box.left, y), At(layer.m_image, box.left - dx, y - dy),
              static_cast<size_t>(box.Width()), pixel);
    }
}

void CPipLayer::Gradient(const PixelBox& rectangle, int32_t direction, const LayerColor& first,
                         const LayerColor& second) {
    if (m_used.IsEmpty() || rectangle.IsEmpty()) {
        return;
    }
    // Per corner, top left, top right, bottom left, bottom right: the first colour, the second, or
    // what lies between them.
    enum Corner { kFirst, kSecond, kMiddle };
    constexpr Corner kCorners[8][4] = {
        {kSecond, kSecond, kFirst, kFirst},  {kFirst, kFirst, kSecond, kSecond},
        {kSecond, kFirst, kSecond, kFirst},  {kFirst, kSecond, kFirst, kSecond},
        {kSecond, kMiddle, kMiddle, kFirst}, {kMiddle, kSecond, kFirst, kMiddle},
        {kMiddle, kFirst, kSecond, kMiddle}, {kFirst, kMiddle, kMiddle, kSecond},
    };
    const auto& corners = kCorners[direction >= 0 && direction < 8 ? direction : 0];
    const auto value = [&](Corner corner, int c) {
        const int a = first.channel[c];
        const int b = second.channel[c];
        return static_cast<float>(corner == kFirst ? a : corner == kSecond ? b : (a + b) >> 1);
    };

    const auto count = static_cast<size_t>(m_used.Width());
    m_columns.assign(count * 8, 0.0F);
    float* top = m_columns.data();
    float* rise = top + count * 4;
    for (size_t i = 0; i < count; ++i) {
        const float part =
            static_cast<float>(m_used.left + static_cast<int32_t>(i) - rectangle.left) /
            static_cast<float>(rectangle.Width());
        for (int c = 0; c < 3; ++c) {
            const float upperLeft = value(corners[0], c);
            const float upper = std::trunc(upperLeft + (value(corners[1], c) - upperLeft) * part);
            const float lowerLeft = value(corners[2], c);
            const float lower = std::trunc(lowerLeft + (value(corners[3], c) - lowerLeft) * part);
            top[i * 4 + static_cast<size_t>(c)] = upper;
            rise[i * 4 + static_cast<size_t>(c)] = lower - upper;
        }
    }
    const GradientRow recolor = FormFor(kGradientRow, m_image);
    for (int32_t y = m_used.top; y < m_used.bottom; ++y) {
        const float part =
            static_cast<float>(y - rectangle.top) / static_cast<float>(rectangle.Height());
        recolor(At(m_image, m_used.left, y), top, rise, count, part);
    }
}

void CPipLayer::ColorKey(const PictureKey& key) {
    if (m_used.IsEmpty()) {
        return;
    }
    CColorKeyPass pass(key, m_bAyuv, m_image.GetCpuLevel());
    const auto count = static_cast<size_t>(m_used.Width());
    for (int32_t y = m_used.top; y < m_used.bottom; ++y) {
        uint8_t* row = At(m_image, m_used.left, y);
        pass.KeyRow(row, y + 1 < m_used.bottom ? row + m_image.GetPitch() : nullptr, count);
    }
}

void CPipLayer::Blur(const PixelBox& content, int32_t radius) {
    // The frame's own limit, before a part of it has another.
    const int32_t shorter = std::min(m_image.GetWidth(), m_image.GetHeight());
    if (radius >= 0 && shorter <= int64_t{2} * radius) {
        radius = (shorter - 1) / 2;
    }
    if (radius <= 0 || m_used.IsEmpty() || content.IsEmpty()) {
        return;
    }
    // The outer margin keeps the windows of what the blur reaches as large as in the frame.
    const PixelBox part = content.Grown(2 * radius).CutTo(Frame());
    CImageARGB view;
    m_image.GetSubImage(view, part.left, part.top, part.Width(), part.Height());
    view.SetCpuLevel(m_image.GetCpuLevel());
    view.BoxBlur(view, radius);
    Outdate();
    const PixelBox reach = content.Grown(radius).CutTo(Frame());
    m_used = {std::min(m_used.left, reach.left), std::min(m_used.top, reach.top),
              std::max(m_used.right, reach.right), std::max(m_used.bottom, reach.bottom)};
}

void CPipLayer::BlendRow(uint8_t* frameRow, int32_t y, uint8_t opacity) const {
    if (!m_used.IsEmpty() && y >= m_used.top && y < m_used.bottom) {
        m_pBlendRow(frameRow + ptrdiff_t{4} * m_used.left, At(m_image, m_used.left, y),
                    static_cast<size_t>(m_used.Width()), opacity);
    }
}

namespace {

// What the pixel callback draws on; under CRasterLock.
struct BorderTarget {
    CImageARGB* layer;
    RasterWindow window;
    uint32_t pixel;
} g_border;

void DrawBorderPixel(const RasterPixel* pixel) {
    const RasterWindow& window = g_border.window;
    if (g_border.layer && pixel->x >= window.left && pixel->x <= window.right &&
        pixel->y >= window.top && pixel->y <= window.bottom) {
        std::memcpy(At(*g_border.layer, pixel->x, pixel->y), &g_border.pixel, 4);
    }
}

// Draws through the callback.
class CCallbackCanvas {
public:
    CCallbackCanvas(CImageARGB& layer, const RasterWindow& window, uint32_t pixel) {
        g_border = {&layer, window, pixel};
        CRasterizer::SetPixelCallback(DrawBorderPixel);
    }
    ~CCallbackCanvas() { g_border.layer = nullptr; }
    CCallbackCanvas(const CCallbackCanvas&) = delete;
    CCallbackCanvas& operator=(const CCallbackCanvas&) = delete;

    void Triangle(const RasterPoint (&points)[3]) {
        CRasterizer::FillTriangleInside(g_border.window, points);
    }
    void Disc(RasterPoint centre, int32_t radius) {
        CRasterizer::FillCircleInside(g_border.window, centre, radius);
    }

private:
    CRasterLock m_lock;
};

// Draws whole spans.
class CSpanCanvas {
public:
    CSpanCanvas(CImageARGB& layer, const RasterWindow& window, uint32_t pixel)
        : m_layer(layer), m_walk(window), m_pixel(pixel) {}

    // Receives spans.
    auto Filler() {
        return [this](int32_t y, int32_t first, int32_t last) {
            auto* to = reinterpret_cast<uint32_t*>(At(m_layer, first, y));
            std::fill(to, to + (last - first + 1), m_pixel);
        };
    }

    void Triangle(const RasterPoint (&points)[3]) { m_walk.ClipTriangle(points, Filler()); }
    void Disc(RasterPoint centre, int32_t radius) { m_walk.ClipCircle(centre, radius, Filler()); }

private:
    CImageARGB& m_layer;
    CWindowWalk m_walk;
    uint32_t m_pixel;
};

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
    return Truncate(
        {static_cast<float>(point.x) + normal.x * by, static_cast<float>(point.y) + normal.y * by});
}

// The normal of the nearest side that has length, from one side on forwards (step 1) or backwards
// (step 3): at a double corner the sides beyond it are those that join.
const RasterPointF& JoinedNormal(const RasterPointF (&normals)[4], int side, int step) {
    for (int i = 0; i < 3 && normals[side].x == 0.0F && normals[side].y == 0.0F; ++i) {
        side = (side + step) % 4;
    }
    return normals[side];
}

template <class Canvas>
void DrawBorderShapes(Canvas& canvas, const RasterPoint (&quad)[4], int32_t size) {
    const int32_t wholeHalf = size / 2;
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
        canvas.Triangle({band[0], band[1], band[2]});
        canvas.Triangle({band[0], band[2], band[3]});
    }
    for (int i = 0; i < 4; ++i) {
        // The bands' ends part on the outer side of the turn: to the left of a turn to the right.
        const RasterPointF& before = JoinedNormal(normals, (i + 3) % 4, 3);
        const RasterPointF& after = JoinedNormal(normals, i, 1);
        const float turn = before.x * after.y - before.y * after.x;
        const float side = turn < 0.0F ? -half : half;
        canvas.Triangle({quad[i], Offset(quad[i], before, side), Offset(quad[i], after, side)});
    }
    for (const RasterPoint& corner : quad) {
        canvas.Disc(corner, wholeHalf - 1);
    }
}

} // namespace

void DrawBorder(CPipLayer& layer, const RasterPoint (&quad)[4], int32_t size, uint32_t pixel) {
    const PixelBox& used = layer.Used();
    if (used.IsEmpty()) {
        return;
    }
    const RasterWindow window = {used.left, used.top, used.right - 1, used.bottom - 1};
    if (Resolve(layer.Image().GetCpuLevel()) == InstructionSet::Scalar) {
        CCallbackCanvas canvas(layer.Image(), window, pixel);
        DrawBorderShapes(canvas, quad, size);
    } else {
        CSpanCanvas canvas(layer.Image(), window, pixel);
        DrawBorderShapes(canvas, quad, size);
    }
}

} // namespace kyv
