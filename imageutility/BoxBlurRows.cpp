// Running sums down the columns, then along the rows, so that the radius costs nothing.
#include "imageutility/BoxBlurRows.h"

#include <algorithm>
#include <cstring>

namespace kyv {
namespace {

// The windows of a length are radius pixels to either side, less what lies outside.
int32_t WindowLength(int32_t position, int32_t length, int32_t radius) {
    return std::min(position + radius, length - 1) - std::max(position - radius, 0) + 1;
}

// For windows whose sum needs more than 31 bits; so large a radius is rare.
void BlurHugeRow(uint8_t* dst, uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                 size_t count, const BoxWindows& windows) {
    BoxColumns32_scalar(sums, enter, leave, count);
    const auto reach = static_cast<ptrdiff_t>(windows.radius) * 4;
    uint64_t total[4] = {};
    for (ptrdiff_t i = -reach; i < reach; ++i) {
        total[i & 3] += sums[i];
    }
    for (size_t i = 0; i < count; ++i, sums += 4, dst += 4) {
        const auto area =
            static_cast<uint64_t>(windows.columns[i]) * static_cast<uint64_t>(windows.rows);
        for (int c = 0; c < 4; ++c) {
            total[c] += sums[c + reach];
            dst[c] = static_cast<uint8_t>(total[c] / area);
            total[c] -= sums[c - reach];
        }
    }
}

} // namespace

void CBoxBlurRows::Begin(int32_t width, int32_t height, int32_t radius, InstructionSet set) {
    const bool sameWindows = width == m_nWidth && radius == m_nRadius && m_pSums;
    m_nWidth = width;
    m_nHeight = height;
    m_nRadius = radius;
    m_set = set;
    m_bWide = radius > kBoxRadiusMax16;
    const auto columns = static_cast<size_t>(width);
    const size_t border = (static_cast<size_t>(radius) + 1) * 4;
    const size_t sumBytes = m_bWide ? sizeof(uint32_t) : sizeof(uint16_t);
    const auto layOut = [&](uint8_t* data) {
        CScratchLayout layout(data);
        auto* sums = layout.Take<uint8_t>((columns * 4 + 2 * border) * sumBytes);
        m_pSums = sums ? sums + border * sumBytes : nullptr;
        m_pColumns = layout.Take<int32_t>(columns);
        m_pReciprocals = layout.Take<float>(columns);
        m_pNoRow = layout.Take<uint8_t>(columns * 4);
        return layout.GetBytes();
    };
    if (!sameWindows) {
        const size_t bytes = layOut(nullptr);
        if (bytes > m_nBytes) {
            m_nBytes = 0;
            m_pBlock.reset(); // two at a time are never needed
            m_pBlock = std::make_unique<CPageBlock>(bytes);
            m_nBytes = bytes;
        }
        layOut(m_pBlock->GetData());
        std::memset(m_pBlock->GetData(), 0, bytes);
        for (int32_t x = 0; x < width; ++x) {
            m_pColumns[x] = WindowLength(x, width, radius);
            m_pReciprocals[x] = 1.0F / static_cast<float>(m_pColumns[x]);
        }
    } else {
        std::memset(m_pSums, 0, columns * 4 * sumBytes);
    }
}

void CBoxBlurRows::BlurImage(const KYVImageUtility::CImageBase& source,
                             const KYVImageUtility::CImageBase& destination, int32_t radius) {
    const int32_t height = source.GetHeight();
    const int32_t shorter = std::min(source.GetWidth(), height);
    if (shorter <= int64_t{2} * radius) {
        radius = (shorter - 1) / 2;
    }
    if (radius == 0) {
        for (int32_t y = 0; y < height; ++y) {
            std::memcpy(destination.Row(y), source.Row(y),
                        static_cast<size_t>(source.GetWidth()) * 4);
        }
        return;
    }
    Begin(source.GetWidth(), height, radius, source.GetInstructionSet());
    for (int32_t y = 0; y < radius; ++y) {
        Slide(source.Row(y), nullptr);
    }
    for (int32_t y = 0; y < height; ++y) {
        Blur(destination.Row(y), y, y + radius < height ? source.Row(y + radius) : nullptr,
             y > radius ? source.Row(y - radius - 1) : nullptr);
    }
}

void CBoxBlurRows::Slide(const uint8_t* enter, const uint8_t* leave) {
    enter = enter ? enter : m_pNoRow;
    leave = leave ? leave : m_pNoRow;
    const auto count = static_cast<size_t>(m_nWidth);
    if (m_bWide) {
        kBoxColumns32.For(m_set)(static_cast<uint32_t*>(m_pSums), enter, leave, count);
    } else {
        kBoxColumns16.For(m_set)(static_cast<uint16_t*>(m_pSums), enter, leave, count);
    }
}

void CBoxBlurRows::Blur(uint8_t* dst, int32_t y, const uint8_t* enter, const uint8_t* leave) {
    BlurPart(dst, y, 0, m_nWidth, enter ? enter : m_pNoRow, leave ? leave : m_pNoRow);
}

void CBoxBlurRows::Average(uint8_t* dst, int32_t y, int32_t first, int32_t end) {
    BlurPart(dst, y, first, end, m_pNoRow, m_pNoRow);
}

void CBoxBlurRows::BlurPart(uint8_t* dst, int32_t y, int32_t first, int32_t end,
                            const uint8_t* enter, const uint8_t* leave) {
    const auto count = static_cast<size_t>(end - first);
    const BoxWindows windows = {.radius = m_nRadius,
                                .rows = WindowLength(y, m_nHeight, m_nRadius),
                                .columns = m_pColumns + first,
                                .reciprocals = m_pReciprocals + first};
    const ptrdiff_t at = ptrdiff_t{4} * first;
    if (!m_bWide) {
        kBoxBlur16.For(m_set)(dst + at, static_cast<uint16_t*>(m_pSums) + at, enter, leave, count,
                              windows);
    } else {
        const BoxBlurRow32 blur = m_nRadius <= kBoxRadiusMax ? kBoxBlur32.For(m_set) : BlurHugeRow;
        blur(dst + at, static_cast<uint32_t*>(m_pSums) + at, enter, leave, count, windows);
    }
}

} // namespace kyv
