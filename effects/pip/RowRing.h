// The rows of a picture that is made from top to bottom, as many as are still looked at.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace kyv {

// Row y takes the place of one that lies at least the asked number of rows above.
class CRowRing {
public:
    // Memory is kept from frame to frame; what it holds is any pixels.
    void Reserve(int32_t width, int32_t rows) {
        m_width = static_cast<size_t>(width);
        const uint32_t places = std::bit_ceil(static_cast<uint32_t>(rows));
        m_mask = places - 1;
        if (m_pixels.size() < m_width * places) {
            m_pixels.resize(m_width * places);
        }
    }

    uint32_t* Row(int32_t y) {
        return m_pixels.data() + (static_cast<uint32_t>(y) & m_mask) * m_width;
    }

private:
    std::vector<uint32_t> m_pixels;
    size_t m_width = 0;
    uint32_t m_mask = 0;
};

} // namespace kyv
