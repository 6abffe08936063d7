// Coverage by runs.
#include "effects/pip/Coverage.h"

#include <cstring>

namespace kyv {
namespace {

constexpr int32_t kStep = 8; // pixels

// True when a step's pixels all have alpha 255, or all 0. Most are the one or the other.
bool AreAll(const uint8_t* pixels, bool covered) {
    constexpr uint64_t kAlphas = 0xFF000000FF000000;
    uint64_t pairs[kStep / 2];
    std::memcpy(pairs, pixels, sizeof pairs);
    return covered ? (pairs[0] & pairs[1] & pairs[2] & pairs[3] & kAlphas) == kAlphas
                   : ((pairs[0] | pairs[1] | pairs[2] | pairs[3]) & kAlphas) == 0;
}

} // namespace

void CCoverage::Begin(int32_t height, const PixelBox& box) {
    m_lastChanged = -1;
    if (height != m_height || box != m_box) {
        m_rows.Begin(height);
        m_height = height;
        m_box = box;
        ++m_serial;
    }
}

void CCoverage::Take(int32_t y, const uint8_t* pixels) {
    m_taken.clear();
    bool covered = false;
    for (int32_t x = m_box.left; x < m_box.right;) {
        const int32_t end = std::min(x + kStep, m_box.right);
        if (end - x == kStep && AreAll(pixels + ptrdiff_t{4} * x, covered)) {
            x = end;
        }
        for (; x < end; ++x) {
            if ((pixels[ptrdiff_t{4} * x + 3] != 0) != covered) {
                covered = !covered;
                if (covered) {
                    m_taken.push_back({x, m_box.right});
                } else {
                    m_taken.back().end = x;
                }
            }
        }
    }
    if (m_rows.Replace(y, m_taken)) {
        m_serial += m_lastChanged < 0;
        m_lastChanged = y;
    }
}

} // namespace kyv
