// Coverage by bits.
#include "effects/pip/Coverage.h"

#include <bit>
#include <cstring>

namespace kyv {
namespace {

constexpr int32_t kWordBits = 64;

// The bits of up to 64 pixels. Most are covered all or not at all.
uint64_t CoverBits(const uint8_t* pixels, int32_t count) {
    uint64_t bits = 0;
    int32_t i = 0;
    for (; i + 8 <= count; i += 8, pixels += 32) {
        uint64_t pairs[4];
        std::memcpy(pairs, pixels, sizeof pairs);
        constexpr uint64_t kAlphas = 0xFF000000FF000000;
        if (((pairs[0] | pairs[1] | pairs[2] | pairs[3]) & kAlphas) == 0) {
            continue;
        }
        if ((pairs[0] & pairs[1] & pairs[2] & pairs[3] & kAlphas) == kAlphas) {
            bits |= uint64_t{255} << i;
            continue;
        }
        for (int32_t k = 0; k < 8; ++k) {
            bits |= uint64_t{pixels[k * 4 + 3] != 0} << (i + k);
        }
    }
    for (; i < count; ++i, pixels += 4) {
        bits |= uint64_t{pixels[3] != 0} << i;
    }
    return bits;
}

} // namespace

void CCoverage::Begin(int32_t width, int32_t height, const PixelBox& box) {
    m_lastChanged = -1;
    if (width == m_width && height == m_height && box == m_box) {
        return;
    }
    m_width = m_height = 0; // until it has worked
    ++m_serial;
    m_scratch.assign((static_cast<size_t>(width) + kWordBits - 1) / kWordBits, 0);
    m_words.assign(m_scratch.size() * static_cast<size_t>(height), 0);
    m_width = width;
    m_height = height;
    m_box = box;
}

void CCoverage::Take(int32_t y, const uint8_t* pixels) {
    for (int32_t x = m_box.left / kWordBits * kWordBits; x < m_box.right; x += kWordBits) {
        const int32_t first = std::max(x, m_box.left);
        const int32_t end = std::min(x + kWordBits, m_box.right);
        m_scratch[static_cast<size_t>(x / kWordBits)] =
            CoverBits(pixels + ptrdiff_t{4} * first, end - first) << (first - x);
    }
    const auto row =
        m_words.begin() + static_cast<ptrdiff_t>(static_cast<size_t>(y) * WordsPerRow());
    if (std::equal(m_scratch.begin(), m_scratch.end(), row)) {
        return;
    }
    std::copy(m_scratch.begin(), m_scratch.end(), row);
    if (m_lastChanged < 0) {
        ++m_serial;
    }
    m_lastChanged = y;
}

void CCoverage::GetRuns(int32_t y, Runs& runs) const {
    runs.clear();
    if (y < m_box.top || y >= m_box.bottom) {
        return;
    }
    const uint64_t* words = m_words.data() + static_cast<size_t>(y) * WordsPerRow();
    int32_t x = m_box.left;
    // The first column from x on whose bit is the wanted one.
    const auto find = [&](bool covered) {
        while (x < m_box.right) {
            const uint64_t word = words[x / kWordBits];
            const int32_t at = x % kWordBits;
            const int skip = std::countr_zero((covered ? word : ~word) >> at);
            if (skip < kWordBits - at) {
                x = std::min(x + skip, m_box.right);
                return;
            }
            x += kWordBits - at;
        }
        x = m_box.right;
    };
    for (find(true); x < m_box.right; find(true)) {
        const int32_t first = x;
        find(false);
        runs.push_back({first, x});
    }
}

} // namespace kyv
