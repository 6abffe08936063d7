// Which pixels of the frame the picture covers, and what of that has changed since the last frame.
#pragma once

#include <cstdint>

#include "effects/pip/SpanRows.h"

namespace kyv {

// Nobody has to know what coverage depends on: it is taken from the picture itself, and compared.
class CCoverage {
public:
    // The rows of a frame of this height follow. Outside the box nothing is covered.
    void Begin(int32_t height, const PixelBox& box);

    // Row y of the box, top to bottom; pixels is the frame's row, of which alpha is looked at.
    void Take(int32_t y, const uint8_t* pixels);

    // The covered columns of a row; none outside the frame.
    std::span<const Run> Row(int32_t y) const { return m_rows.Row(y); }
    const PixelBox& Box() const { return m_box; }

    // Another number whenever anything has changed.
    uint64_t Serial() const { return m_serial; }
    // The lowest row that has changed in this frame so far, -1 for none.
    int32_t LastChanged() const { return m_lastChanged; }

private:
    int32_t m_height = 0;
    PixelBox m_box = {};
    CSpanRows m_rows;
    Runs m_taken;
    uint64_t m_serial = 0;
    int32_t m_lastChanged = -1;
};

} // namespace kyv
