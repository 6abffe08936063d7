// The picture, row by row.
#include "effects/pip/PictureRows.h"

#include <algorithm>

#include "effects/pip/LayerRows.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

uint8_t* Bytes(uint32_t* pixels) {
    return reinterpret_cast<uint8_t*>(pixels);
}

} // namespace

void CPictureRows::Begin(CFreeformPiP& pip, const CImageARGB& foreground,
                         const PictureSettings& settings) {
    m_pPip = &pip;
    m_settings = settings;
    m_nWidth = foreground.GetWidth();
    m_nHeight = foreground.GetHeight();
    m_set = foreground.GetInstructionSet();
    const PixelBox frame = {0, 0, m_nWidth, m_nHeight};
    const PixelBox drawn =
        pip.BeginRows(foreground) ? pip.Spans().Bounds().CutTo(settings.box) : PixelBox{};
    m_box = drawn.IsEmpty() ? PixelBox{} : drawn.Grown(1).CutTo(frame);
    m_reach = drawn.IsEmpty() ? PixelBox{} : drawn.Grown(settings.blur).CutTo(frame);
    m_part =
        settings.blur > 0 && !drawn.IsEmpty() ? drawn.Grown(2 * settings.blur).CutTo(frame) : m_box;
    m_nDrawn = m_nMade = m_box.top;
    m_nBlurred = -1;
    // Rows from the one that leaves the blur's window to the one that the key looks at.
    m_rows.Reserve(m_nWidth, std::min(settings.lead + settings.blur + 4, m_nHeight));
    m_clear = 0;
    if (settings.ayuv && settings.key.enabled) {
        // Keying takes the whole frame through RGB, from where zeros come back as something else.
        kToARGB.scalar(Bytes(&m_clear), Bytes(&m_clear), 1);
        kToAYUV.scalar(Bytes(&m_clear), Bytes(&m_clear), 1);
    }
    if (settings.blur > 0) {
        m_clearRow.assign(static_cast<size_t>(m_nWidth), m_clear);
        m_blurred.resize(static_cast<size_t>(m_nWidth));
        m_extents.Begin(m_nHeight);
        for (int32_t y = m_box.top; y < m_box.bottom; ++y) {
            m_extents.Add(y, pip.Spans().Row(y));
        }
    }
}

void CPictureRows::MakeTo(int32_t y) {
    for (const int32_t end = std::min(y + 1, m_box.bottom); m_nMade < end; ++m_nMade) {
        while (m_nDrawn < std::min(m_nMade + 2, m_box.bottom)) {
            Draw(m_nDrawn++);
        }
        Finish(m_nMade);
    }
}

void CPictureRows::Draw(int32_t y) {
    uint32_t* row = m_rows.Row(y);
    std::fill(row + m_part.left, row + m_part.right, 0);
    m_pPip->DrawRow(y, Bytes(row));
    // A quad may go on where its box ends.
    std::fill(row + m_box.right, row + m_part.right, 0);
    if (m_settings.key.enabled && m_settings.ayuv) {
        uint8_t* pixels = Bytes(row + m_box.left);
        kToARGB.For(m_set)(pixels, pixels, static_cast<size_t>(m_box.Width()));
    }
}

void CPictureRows::Finish(int32_t y) {
    uint32_t* row = m_rows.Row(y);
    if (m_settings.key.enabled) {
        const auto count = static_cast<size_t>(m_box.Width());
        const uint32_t* below = m_rows.Row(std::min(y + 1, m_box.bottom - 1));
        uint8_t* pixels = Bytes(row + m_box.left);
        kColorKeyRow.For(m_set)(pixels, reinterpret_cast<const uint8_t*>(below + m_box.left), count,
                                m_settings.key.color, m_settings.key.tolerance);
        if (m_settings.ayuv) {
            kToAYUV.For(m_set)(pixels, pixels, count);
            std::fill(row + m_part.left, row + m_box.left, m_clear);
            std::fill(row + m_box.right, row + m_part.right, m_clear);
        }
    }
    if (m_settings.coverage) {
        m_settings.coverage->Take(y, Bytes(row));
    }
}

// Null for a row outside the frame.
const uint8_t* CPictureRows::BlurSource(int32_t y) {
    if (y < 0 || y >= m_nHeight) {
        return nullptr;
    }
    MakeTo(y);
    const bool drawn = y >= m_box.top && y < m_box.bottom;
    return Bytes((drawn ? m_rows.Row(y) : m_clearRow.data()) + m_part.left);
}

void CPictureRows::Blend(int32_t y, uint8_t* frameRow, uint8_t opacity) {
    const AlphaBlendRow blend = kAlphaBlend.For(m_set);
    const auto blendPart = [&](const uint32_t* row, int32_t first, int32_t end) {
        if (frameRow && first < end) {
            blend(frameRow + ptrdiff_t{4} * first, reinterpret_cast<const uint8_t*>(row + first),
                  static_cast<size_t>(end - first), opacity);
        }
    };
    if (y < m_reach.top || y >= m_reach.bottom) {
        return;
    }
    const int32_t radius = m_settings.blur;
    if (radius == 0) {
        MakeTo(y);
        for (const Run& run : m_pPip->Spans().Row(y)) {
            blendPart(m_rows.Row(y), std::max(run.first, m_box.left),
                      std::min(run.end, m_box.right));
        }
        return;
    }
    const uint8_t* leave = nullptr;
    if (m_nBlurred != y - 1 || y == m_reach.top) {
        m_window.Begin(m_part.Width(), m_nHeight, radius, m_set);
        for (int32_t row = y - radius; row < y + radius; ++row) {
            m_window.Slide(BlurSource(row), nullptr);
        }
    } else {
        leave = BlurSource(y - radius - 1);
    }
    const uint8_t* enter = BlurSource(y + radius);
    uint8_t* blurred = Bytes(m_blurred.data() + m_part.left);
    m_nBlurred = y;
    const Run reach = {m_reach.left, m_reach.right};
    if (m_clear != 0) {
        m_window.Blur(blurred, y, enter, leave);
    } else {
        m_window.Slide(enter, leave);
        m_extents.ForWindow(y, radius, reach, [&](int32_t first, int32_t end) {
            m_window.Average(blurred, y, first - m_part.left, end - m_part.left);
        });
    }
    m_extents.ForWindow(y, radius, reach, [&](int32_t first, int32_t end) {
        blendPart(m_blurred.data(), first, end);
    });
}

} // namespace kyv
