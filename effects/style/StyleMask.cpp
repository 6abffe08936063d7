// Masks of the style effects.
#include "effects/style/StyleMask.h"

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

#include "effects/style/StyleMath.h"

namespace kyv {
namespace {

constexpr float kFarthest = 16.0F;
constexpr float kDeepest = 0.4F;

float Within(float value, float minimum, float maximum) {
    return value == value ? std::clamp(value, minimum, maximum) : 0.0F;
}

float SmoothStep(float t) {
    const float x = std::clamp(t, 0.0F, 1.0F);
    return x * x * (3.0F - 2.0F * x);
}

uint8_t ToWeight(float inside, bool outside) {
    const int32_t weight = RoundHalfUp(inside * 255.0F);
    return static_cast<uint8_t>(outside ? 255 - weight : weight);
}

// How far each pixel's centre lies inside the span, in units of the rim.
std::vector<float> RiseAcross(float from, float to, int32_t count, float rim) {
    std::vector<float> rise(static_cast<size_t>(count));
    for (int32_t i = 0; i < count; ++i) {
        const float centre = static_cast<float>(i) + 0.5F;
        // Half a pixel, so that a sharp border between pixels takes the whole pixel.
        rise[i] = SmoothStep((std::min(centre - from, to - centre) + 0.5F) / rim);
    }
    return rise;
}

} // namespace

MaskShape Normalize(const MaskShape& shape) {
    MaskShape result = shape;
    for (float* side : {&result.left, &result.top, &result.right, &result.bottom}) {
        *side = Within(*side, -kFarthest, kFarthest);
    }
    if (result.left > result.right) {
        std::swap(result.left, result.right);
    }
    if (result.top > result.bottom) {
        std::swap(result.top, result.bottom);
    }
    result.depth = Within(result.depth, 0.0F, kDeepest);
    return result;
}

void CStyleMask::Update(const MaskShape& shape, int32_t width, int32_t height) {
    const bool whole =
        shape.left == 0.0F && shape.top == 0.0F && shape.right == 0.0F && shape.bottom == 0.0F;
    const bool empty = shape.left >= shape.right || shape.top >= shape.bottom;
    if (whole || empty) {
        m_kind = whole != shape.outside ? Kind::Whole : Kind::Nothing;
        return;
    }
    m_kind = Kind::Shape;
    if (m_bFilled && m_shape == shape && m_width == width && m_height == height) {
        return;
    }
    m_bFilled = false; // should an allocation fail
    if (m_width != width || m_height != height || !m_weights.GetBuffer()) {
        m_weights.Create(width, height);
        m_width = width;
        m_height = height;
    }
    m_shape = shape;
    if (shape.ellipse) {
        FillEllipse();
    } else {
        FillBox();
    }
    m_bFilled = true;
}

void CStyleMask::FillBox() {
    const auto width = static_cast<float>(m_width);
    const auto height = static_cast<float>(m_height);
    const float left = m_shape.left * width;
    const float right = m_shape.right * width;
    const float top = m_shape.top * height;
    const float bottom = m_shape.bottom * height;
    const float widest = 0.5F * std::min(right - left, bottom - top);
    const float rim = std::max(std::min(m_shape.depth * std::min(width, height), widest), 1.0F);
    const std::vector<float> across = RiseAcross(left, right, m_width, rim);
    const std::vector<float> down = RiseAcross(top, bottom, m_height, rim);
    for (int32_t y = 0; y < m_height; ++y) {
        uint8_t* row = m_weights.Row(y);
        for (int32_t x = 0; x < m_width; ++x) {
            row[x] = ToWeight(across[x] * down[y], m_shape.outside);
        }
    }
}

void CStyleMask::FillEllipse() {
    const auto width = static_cast<float>(m_width);
    const auto height = static_cast<float>(m_height);
    const float radiusX = std::max(0.5F * (m_shape.right - m_shape.left) * width, 0.5F);
    const float radiusY = std::max(0.5F * (m_shape.bottom - m_shape.top) * height, 0.5F);
    const float centreX = 0.5F * (m_shape.left + m_shape.right) * width;
    const float centreY = 0.5F * (m_shape.top + m_shape.bottom) * height;
    const float smaller = std::min(radiusX, radiusY);
    const float rim = std::max(std::min(m_shape.depth * std::min(width, height), smaller), 1.0F);
    for (int32_t y = 0; y < m_height; ++y) {
        const float dy = (static_cast<float>(y) + 0.5F - centreY) / radiusY;
        uint8_t* row = m_weights.Row(y);
        for (int32_t x = 0; x < m_width; ++x) {
            const float dx = (static_cast<float>(x) + 0.5F - centreX) / radiusX;
            // The distance in units of the radii, brought to pixels by the smaller one, which is
            // right along that axis and a wider rim along the other.
            const float inside = (1.0F - std::sqrt(dx * dx + dy * dy)) * smaller;
            row[x] = ToWeight(SmoothStep((inside + 0.5F) / rim), m_shape.outside);
        }
    }
}

} // namespace kyv
