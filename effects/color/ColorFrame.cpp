// Frames of the colour corrections.
#include "effects/color/ColorFrame.h"

namespace kyv {

RowSelection SelectField(const EffectContext& context) {
    switch (context.fieldSelector) {
    case FieldSelector_First:
        return {0, 2};
    case FieldSelector_Second:
        return {1, 2};
    default:
        return {0, 1};
    }
}

CColorFrame::CColorFrame(const EffectContext& context, const FrameGeometry& geometry, void* output,
                         const void* input)
    : m_pOutput(static_cast<uint8_t*>(output) + geometry.viewOffset),
      m_pInput(static_cast<const uint8_t*>(input) + geometry.viewOffset), m_width(geometry.width),
      m_height(geometry.height), m_pitch(geometry.pitchBytes),
      m_ayuv(context.pixelFormat == PixelFormat_Ayuv), m_toArgb(kToARGB.For(geometry.level.set)),
      m_toAyuv(kToAYUV.For(geometry.level.set)) {}

} // namespace kyv
