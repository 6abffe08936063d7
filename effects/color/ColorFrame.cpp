// Wrapping and converting the frames of the colour corrections.
#include "effects/color/ColorFrame.h"

#include <cstring>

namespace kyv {

using KYVImageUtility::CImageAYUV;

CColorFrame::CColorFrame(const EffectContext& context, const FrameGeometry& geometry, void* output,
                         const void* input)
    : m_geometry(geometry), m_pOutput(static_cast<uint8_t*>(output) + geometry.viewOffset),
      m_cpuLevel(context.cpuLevel), m_ayuv(context.pixelFormat == PixelFormat_Ayuv) {
    if (context.fieldSelector == FieldSelector_First ||
        context.fieldSelector == FieldSelector_Second) {
        m_firstRow = context.fieldSelector == FieldSelector_Second ? 1 : 0;
        m_rowStep = 2;
    }
    // Views are not written through the source image.
    auto* from = static_cast<uint8_t*>(const_cast<void*>(input)) + geometry.viewOffset;
    if (!m_ayuv) {
        m_source.Attach(from, geometry.width, geometry.height, geometry.pitchBytes);
        m_target.Attach(m_pOutput, geometry.width, geometry.height, geometry.pitchBytes);
        return;
    }
    CImageAYUV frame(from, geometry.width, geometry.height, geometry.pitchBytes);
    frame.SetCpuLevel(m_cpuLevel);
    m_private.Create(geometry.width, geometry.height);
    frame.ToARGB(m_private);
    m_source.Attach(m_private.GetBuffer(), geometry.width, geometry.height, m_private.GetPitch());
    m_target.Attach(m_private.GetBuffer(), geometry.width, geometry.height, m_private.GetPitch());
}

void CColorFrame::Finish() {
    if (!m_ayuv) {
        return;
    }
    CImageAYUV frame(m_pOutput, m_geometry.width, m_geometry.height, m_geometry.pitchBytes);
    m_private.SetCpuLevel(m_cpuLevel);
    m_private.ToAYUV(frame);
}

void CColorFrame::CopyPixels(uint8_t* dst, const uint8_t* src, int32_t count) {
    if (dst != src && count > 0) {
        std::memcpy(dst, src, static_cast<size_t>(count) * 4);
    }
}

} // namespace kyv
