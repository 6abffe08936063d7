// Borders and shadows, row by row.
#include "effects/pip/ShapeLayer.h"

#include <algorithm>
#include <cmath>

#include "effects/pip/LayerRows.h"

namespace kyv {

void CShapeLayer::Begin(const LayerRecipe& recipe, const CSpanRows& quad, const CSpanRows& border,
                        const CCoverage& coverage, InstructionSet set) {
    m_bRemake = m_made != Made{recipe, coverage.Serial()};
    m_made.reset();
    m_recipe = recipe;
    m_pBorder = &border;
    m_pCoverage = &coverage;
    if (m_bRemake) {
        const PixelBox frame = {0, 0, recipe.shape.width, recipe.shape.height};
        // Zeros would be a green that a blur draws into every rim.
        m_clear = recipe.ayuv ? 0x00108080 : 0;
        Lay({.width = frame.right,
             .height = frame.bottom,
             // Only what is in the frame casts a shadow.
             .content = border.Bounds()
                            .About(coverage.Box())
                            .CutTo(recipe.shape.WidenedBox().CutTo(frame))
                            .Moved(recipe.dx, recipe.dy)
                            .CutTo(frame),
             .clear = m_clear,
             .blur = recipe.style.blur,
             .lead = recipe.style.blur,
             .kept = true});
        PrepareExtents(quad);
        PrepareGradient();
    }
    Rewind(set);
}

void CShapeLayer::PrepareExtents(const CSpanRows& quad) {
    for (int32_t y = Content().top; y < Content().bottom; ++y) {
        const int32_t from = y - m_recipe.dy;
        Unite(m_recipe.takesBorder ? m_pBorder->Row(from) : std::span<const Run>(),
              m_recipe.takesPicture ? quad.Row(from) : std::span<const Run>(), m_covered);
        for (Run& run : m_covered) {
            run = {run.first + m_recipe.dx, run.end + m_recipe.dx};
        }
        m_extents.Add(y, m_covered);
    }
}

void CShapeLayer::PrepareGradient() {
    const LayerStyle& style = m_recipe.style;
    PixelBox& box = m_gradientBox;
    box = m_recipe.shape.WidenedBox().Moved(m_recipe.dx, m_recipe.dy);
    box = {box.left, box.top, box.right - 1, box.bottom - 1};
    m_gradient.clear();
    if (style.first == style.second || box.IsEmpty()) {
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
    const int32_t direction = style.direction;
    const auto& corners = kCorners[direction >= 0 && direction < 8 ? direction : 0];
    const auto value = [&](Corner corner, int c) {
        const int a = style.first.channel[c];
        const int b = style.second.channel[c];
        return static_cast<float>(corner == kFirst ? a : corner == kSecond ? b : (a + b) >> 1);
    };
    const auto count = static_cast<size_t>(Part().Width());
    m_gradient.assign(count * 8, 0.0F);
    float* top = m_gradient.data();
    float* rise = top + count * 4;
    for (size_t i = 0; i < count; ++i) {
        const float part = static_cast<float>(Part().left + static_cast<int32_t>(i) - box.left) /
                           static_cast<float>(box.Width());
        for (int c = 0; c < 3; ++c) {
            const float upperLeft = value(corners[0], c);
            const float upper = std::trunc(upperLeft + (value(corners[1], c) - upperLeft) * part);
            const float lowerLeft = value(corners[2], c);
            const float lower = std::trunc(lowerLeft + (value(corners[3], c) - lowerLeft) * part);
            top[i * 4 + static_cast<size_t>(c)] = upper;
            rise[i * 4 + static_cast<size_t>(c)] = lower - upper;
        }
    }
}

void CShapeLayer::Make(int32_t y) {
    uint32_t* const row = Row(y);
    std::fill(row + Part().left, row + Part().right, m_clear);
    const auto fill = [&](Run run, uint32_t pixel) {
        run = {std::max(run.first + m_recipe.dx, Content().left),
               std::min(run.end + m_recipe.dx, Content().right)};
        if (run.first < run.end) {
            std::fill(row + run.first, row + run.end, pixel);
        }
        return run;
    };
    const int32_t from = y - m_recipe.dy;
    const std::span<const Run> picture = m_pCoverage->Row(from);
    const std::span<const Run> border =
        m_recipe.takesBorder ? m_pBorder->Row(from) : std::span<const Run>();
    if (m_recipe.takesPicture) {
        Unite(picture, border, m_covered);
    } else {
        Subtract(border, picture, m_covered);
    }
    if (m_recipe.cutsPicture) {
        for (const Run& run : picture) {
            fill(run, 0);
        }
    }
    const float* const rise = m_gradient.data() + m_gradient.size() / 2;
    const float down =
        static_cast<float>(y - m_gradientBox.top) / static_cast<float>(m_gradientBox.Height());
    for (const Run& covered : m_covered) {
        const Run run = fill(covered, m_recipe.style.first.Opaque());
        if (!m_gradient.empty() && run.first < run.end) {
            const auto at = static_cast<size_t>(run.first - Part().left) * 4;
            kGradientRow.For(Set())(reinterpret_cast<uint8_t*>(row + run.first),
                                    m_gradient.data() + at, rise + at,
                                    static_cast<size_t>(run.end - run.first), down);
        }
    }
}

} // namespace kyv
