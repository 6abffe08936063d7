// Rows in order, through the blur.
#include "effects/pip/RowLayer.h"

#include <algorithm>

namespace kyv {
namespace {

void Reserve(std::vector<uint32_t>& pixels, size_t count) {
    if (pixels.size() < count) {
        pixels.resize(count);
    }
}

} // namespace

void CRowLayer::Lay(const LayerPlan& plan) {
    m_plan = plan;
    const PixelBox frame = {0, 0, plan.width, plan.height};
    const bool empty = plan.content.IsEmpty();
    m_reach = empty ? PixelBox{} : plan.content.Grown(plan.blur).CutTo(frame);
    m_part = empty ? PixelBox{} : plan.content.Grown(2 * plan.blur).CutTo(frame);
    m_nWidth = static_cast<size_t>(plan.width);
    // Without a blur the rows themselves are what is kept. Otherwise they are there from the one
    // that leaves the window to the one after the lead, which a key may look at.
    const bool keepsRows = plan.kept && plan.blur == 0;
    m_nPlaces = static_cast<size_t>(keepsRows ? plan.height
                                              : std::min(plan.lead + plan.blur + 4, plan.height));
    Reserve(m_rows, m_nWidth * m_nPlaces);
    if (plan.blur > 0) {
        Reserve(m_blurred, m_nWidth * static_cast<size_t>(plan.kept ? plan.height : 1));
        m_clearRow.assign(m_nWidth, plan.clear);
    }
    m_extents.Begin(plan.height);
}

void CRowLayer::Rewind(InstructionSet set) {
    m_set = set;
    m_nMade = m_plan.content.top;
    m_nBlurred = kNoRow;
}

void CRowLayer::MakeTo(int32_t y) {
    for (const int32_t end = std::min(y + 1, m_plan.content.bottom); m_nMade < end; ++m_nMade) {
        Make(m_nMade);
    }
}

// Null for a row outside the frame.
const uint8_t* CRowLayer::BlurSource(int32_t y) {
    if (y < 0 || y >= m_plan.height) {
        return nullptr;
    }
    MakeTo(y);
    const bool made = y >= m_plan.content.top && y < m_plan.content.bottom;
    return reinterpret_cast<const uint8_t*>((made ? Row(y) : m_clearRow.data()) + m_part.left);
}

uint32_t* CRowLayer::Blended(int32_t y) {
    if (m_plan.blur == 0) {
        return Row(y);
    }
    return m_blurred.data() + (m_plan.kept ? static_cast<size_t>(y) * m_nWidth : 0);
}

// take(first, end) for the columns of a row that the layer's pixels reach.
template <class Take>
void CRowLayer::ForReach(int32_t y, Take&& take) const {
    m_extents.ForWindow(y, m_plan.blur, {m_reach.left, m_reach.right}, take);
}

void CRowLayer::Blur(int32_t y) {
    const int32_t radius = m_plan.blur;
    const bool follows = m_nBlurred == y - 1;
    if (!follows) {
        m_window.Begin(m_part.Width(), m_plan.height, radius, m_set);
        for (int32_t row = y - radius; row < y + radius; ++row) {
            m_window.Slide(BlurSource(row), nullptr);
        }
    }
    const uint8_t* leave = follows ? BlurSource(y - radius - 1) : nullptr;
    const uint8_t* enter = BlurSource(y + radius);
    m_nBlurred = y;
    auto* const blurred = reinterpret_cast<uint8_t*>(Blended(y) + m_part.left);
    if (m_plan.clear != 0) {
        m_window.Blur(blurred, y, enter, leave);
        return;
    }
    m_window.Slide(enter, leave);
    ForReach(y, [&](int32_t first, int32_t end) {
        m_window.Average(blurred, y, first - m_part.left, end - m_part.left);
    });
}

void CRowLayer::Blend(int32_t y, uint8_t* frameRow, uint8_t opacity) {
    if (y < m_reach.top || y >= m_reach.bottom) {
        return;
    }
    if (IsOutdated(y)) {
        m_nMade = std::max(m_nMade, y - m_plan.blur); // over rows that nobody has asked for
        if (m_plan.blur > 0) {
            Blur(y);
        } else {
            MakeTo(y);
        }
    }
    if (frameRow) {
        ForReach(y, [&](int32_t first, int32_t end) {
            kAlphaBlend.For(m_set)(frameRow + ptrdiff_t{4} * first,
                                   reinterpret_cast<const uint8_t*>(Blended(y) + first),
                                   static_cast<size_t>(end - first), opacity);
        });
    }
}

} // namespace kyv
