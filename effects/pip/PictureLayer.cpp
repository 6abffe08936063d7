// The picture's rows.
#include "effects/pip/PictureLayer.h"

#include <algorithm>

#include "effects/pip/LayerRows.h"
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"

namespace kyv {
namespace {

uint8_t* Bytes(uint32_t* pixels) {
    return reinterpret_cast<uint8_t*>(pixels);
}

} // namespace

void CPictureLayer::Begin(CFreeformPiP& pip, const KYVImageUtility::CImageARGB& foreground,
                          const PictureSettings& settings) {
    m_pPip = &pip;
    m_settings = settings;
    m_clear = 0;
    if (settings.ayuv && settings.key.enabled) {
        // Keying takes the whole frame through RGB, from where zeros come back as something else.
        kToARGB.scalar(Bytes(&m_clear), Bytes(&m_clear), 1);
        kToAYUV.scalar(Bytes(&m_clear), Bytes(&m_clear), 1);
    }
    const int32_t width = foreground.GetWidth();
    const int32_t height = foreground.GetHeight();
    const PixelBox drawn =
        pip.BeginRows(foreground) ? pip.Spans().Bounds().CutTo(settings.box) : PixelBox{};
    const PixelBox box = drawn.IsEmpty() ? PixelBox{} : drawn.Grown(1).CutTo({0, 0, width, height});
    Lay({.width = width,
         .height = height,
         .content = box,
         .clear = m_clear,
         .blur = settings.blur,
         .lead = settings.lead,
         .kept = false});
    Rewind(foreground.GetInstructionSet());
    for (int32_t y = box.top; y < box.bottom; ++y) {
        m_extents.Add(y, pip.Spans().Row(y));
    }
    m_nDrawn = box.top;
}

void CPictureLayer::Draw(int32_t y) {
    uint32_t* row = Row(y);
    std::fill(row + Part().left, row + Part().right, 0);
    m_pPip->DrawRow(y, Bytes(row));
    // A quad may go on where its box ends.
    std::fill(row + Content().right, row + Part().right, 0);
    if (m_settings.key.enabled && m_settings.ayuv) {
        uint8_t* pixels = Bytes(row + Content().left);
        kToARGB.For(Set())(pixels, pixels, static_cast<size_t>(Content().Width()));
    }
}

void CPictureLayer::Make(int32_t y) {
    const PixelBox& box = Content();
    const int32_t below = std::min(y + 1, box.bottom - 1);
    while (m_nDrawn <= below) {
        Draw(m_nDrawn++);
    }
    uint32_t* row = Row(y);
    if (m_settings.key.enabled) {
        const auto count = static_cast<size_t>(box.Width());
        uint8_t* pixels = Bytes(row + box.left);
        kColorKeyRow.For(Set())(pixels, Bytes(Row(below) + box.left), count, m_settings.key.color,
                                m_settings.key.tolerance);
        if (m_settings.ayuv) {
            kToAYUV.For(Set())(pixels, pixels, count);
            std::fill(row + Part().left, row + box.left, m_clear);
            std::fill(row + box.right, row + Part().right, m_clear);
        }
    }
    if (m_settings.coverage) {
        m_settings.coverage->Take(y, Bytes(row));
    }
}

} // namespace kyv
