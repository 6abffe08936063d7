// The layers, row by row.
#include "effects/pip/PipLayer.h"

#include <algorithm>
#include <cmath>

#include "effects/pip/LayerRows.h"

namespace kyv {

void CPipLayer::Begin(const LayerRecipe& recipe, const CSpanRows& quad, const CSpanRows& border,
                      const CCoverage& coverage, InstructionSet set) {
    m_bRemake = m_made != Made{recipe, coverage.Serial()};
    m_made.reset();
    m_recipe = recipe;
    m_pBorder = &border;
    m_pCoverage = &coverage;
    m_set = set;
    m_nBlurred = -1;
    if (!m_bRemake) {
        return;
    }
    const int32_t radius = recipe.blur;
    const PixelBox frame = {0, 0, recipe.shape.width, recipe.shape.height};
    m_width = static_cast<size_t>(frame.right);
    m_pixels.resize(m_width * static_cast<size_t>(frame.bottom));
    // Only what is in the frame casts a shadow.
    m_content = recipe.box.CutTo(frame).Moved(recipe.dx, recipe.dy).CutTo(frame);
    const bool empty = m_content.IsEmpty();
    m_part = empty ? PixelBox{} : m_content.Grown(2 * radius).CutTo(frame);
    m_reach = empty ? PixelBox{} : m_content.Grown(radius).CutTo(frame);
    // Zeros would be a green that a blur draws into every rim.
    m_clear = recipe.ayuv ? 0x00108080 : 0;
    if (radius > 0) {
        m_sources.Reserve(m_part.Width(), std::min(2 * radius + 2, frame.bottom));
        m_clearRow.assign(static_cast<size_t>(m_part.Width()), m_clear);
    }
    PrepareExtents(quad);
    PrepareGradient();
}

void CPipLayer::PrepareExtents(const CSpanRows& quad) {
    m_extents.Begin(m_recipe.shape.height);
    for (int32_t y = m_content.top; y < m_content.bottom; ++y) {
        const int32_t from = y - m_recipe.dy;
        m_covered.clear();
        if (m_recipe.takesBorder) {
            Unite(m_pBorder->Row(from),
                  m_recipe.takesPicture ? quad.Row(from) : std::span<const Run>(), m_covered);
        } else if (m_recipe.takesPicture) {
            m_covered.assign(quad.Row(from).begin(), quad.Row(from).end());
        }
        for (Run& run : m_covered) {
            run = {run.first + m_recipe.dx, run.end + m_recipe.dx};
        }
        m_extents.Add(y, m_covered);
    }
}

void CPipLayer::PrepareGradient() {
    m_gradient.clear();
    const PixelBox& box = m_recipe.gradientBox;
    if (m_recipe.first == m_recipe.second || box.IsEmpty()) {
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
    const int32_t direction = m_recipe.direction;
    const auto& corners = kCorners[direction >= 0 && direction < 8 ? direction : 0];
    const auto value = [&](Corner corner, int c) {
        const int a = m_recipe.first.channel[c];
        const int b = m_recipe.second.channel[c];
        return static_cast<float>(corner == kFirst ? a : corner == kSecond ? b : (a + b) >> 1);
    };
    const auto count = static_cast<size_t>(m_part.Width());
    m_gradient.assign(count * 8, 0.0F);
    float* top = m_gradient.data();
    float* rise = top + count * 4;
    for (size_t i = 0; i < count; ++i) {
        const float part = static_cast<float>(m_part.left + static_cast<int32_t>(i) - box.left) /
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

// The part's columns of row y, before the blur.
void CPipLayer::Fill(int32_t y, uint8_t* part) {
    auto* pixels = reinterpret_cast<uint32_t*>(part);
    std::fill_n(pixels, m_part.Width(), m_clear);
    const int32_t from = y - m_recipe.dy;
    m_pCoverage->GetRuns(from, m_picture);
    const std::span<const Run> shape = m_pBorder->Row(from);
    if (m_recipe.takesPicture && m_recipe.takesBorder) {
        Unite(m_picture, shape, m_covered);
    } else if (m_recipe.takesPicture) {
        m_covered.swap(m_picture);
    } else if (m_recipe.takesBorder) {
        Subtract(shape, m_picture, m_covered);
    } else {
        m_covered.clear();
    }
    const auto fill = [&](Run run, uint32_t pixel) {
        run = {std::max(run.first + m_recipe.dx, m_content.left) - m_part.left,
               std::min(run.end + m_recipe.dx, m_content.right) - m_part.left};
        if (run.first < run.end) {
            std::fill(pixels + run.first, pixels + run.end, pixel);
        }
        return run;
    };
    if (m_recipe.cutsPicture) {
        for (const Run& run : m_picture) {
            fill(run, 0);
        }
    }
    const auto count = static_cast<size_t>(m_part.Width());
    const PixelBox& box = m_recipe.gradientBox;
    for (const Run& covered : m_covered) {
        const Run run = fill(covered, m_recipe.first.Opaque());
        if (!m_gradient.empty() && run.first < run.end) {
            const auto at = static_cast<size_t>(run.first) * 4;
            const float down = static_cast<float>(y - box.top) / static_cast<float>(box.Height());
            kGradientRow.For(m_set)(part + at, m_gradient.data() + at,
                                    m_gradient.data() + count * 4 + at,
                                    static_cast<size_t>(run.end - run.first), down);
        }
    }
}

// Null for a row outside the frame. Rows are asked for in order, but for those that the window
// still holds.
const uint8_t* CPipLayer::BlurSource(int32_t y) {
    if (y < 0 || y >= m_recipe.shape.height) {
        return nullptr;
    }
    if (y < m_content.top || y >= m_content.bottom) {
        return reinterpret_cast<const uint8_t*>(m_clearRow.data());
    }
    auto* row = reinterpret_cast<uint8_t*>(m_sources.Row(y));
    if (y >= m_nSources) {
        Fill(y, row);
        m_nSources = y + 1;
    }
    return row;
}

// take(first, end) for the columns of a row that the layer's pixels reach.
template <class Take>
void CPipLayer::ForReach(int32_t y, Take&& take) const {
    m_extents.ForWindow(y, m_recipe.blur, {m_reach.left, m_reach.right}, take);
}

void CPipLayer::MakeRow(int32_t y) {
    const int32_t radius = m_recipe.blur;
    if (radius == 0) {
        Fill(y, Kept(m_part.left, y));
        return;
    }
    const uint8_t* leave = nullptr;
    if (m_nBlurred < 0 || m_nBlurred != y - 1) {
        m_window.Begin(m_part.Width(), m_recipe.shape.height, radius, m_set);
        m_nSources = y - radius;
        for (int32_t row = y - radius; row < y + radius; ++row) {
            m_window.Slide(BlurSource(row), nullptr);
        }
    } else {
        leave = BlurSource(y - radius - 1);
    }
    const uint8_t* enter = BlurSource(y + radius);
    m_nBlurred = y;
    if (m_clear != 0) {
        m_window.Blur(Kept(m_part.left, y), y, enter, leave);
        return;
    }
    m_window.Slide(enter, leave);
    ForReach(y, [&](int32_t first, int32_t end) {
        m_window.Average(Kept(m_part.left, y), y, first - m_part.left, end - m_part.left);
    });
}

void CPipLayer::Blend(int32_t y, uint8_t* frameRow, uint8_t opacity) {
    if (y < m_reach.top || y >= m_reach.bottom) {
        return;
    }
    if (m_bRemake || m_pCoverage->LastChanged() >= y - m_recipe.dy - m_recipe.blur) {
        MakeRow(y);
    }
    if (frameRow) {
        ForReach(y, [&](int32_t first, int32_t end) {
            kAlphaBlend.For(m_set)(frameRow + ptrdiff_t{4} * first, Kept(first, y),
                                   static_cast<size_t>(end - first), opacity);
        });
    }
}

} // namespace kyv
