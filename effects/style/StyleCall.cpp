// Frames and parameters of the style effects.
#include "effects/style/StyleCall.h"

namespace kyv {

StyleFrame MakeStyleFrame(const EffectContext& context, const FrameGeometry& geometry,
                          const void* input) {
    const bool field = context.fieldSelector == FieldSelector_First ||
                       context.fieldSelector == FieldSelector_Second;
    return {
        .input = static_cast<const uint8_t*>(input) + geometry.viewOffset,
        .output = static_cast<uint8_t*>(context.frame) + geometry.viewOffset,
        .pitchBytes = geometry.pitchBytes,
        .width = geometry.width,
        .height = geometry.height,
        .ayuv = context.pixelFormat == PixelFormat_Ayuv,
        .firstRow = context.fieldSelector == FieldSelector_Second ? 1 : 0,
        .rowStep = field ? 2 : 1,
        .level = geometry.level,
    };
}

GpuMask ToGpuMask(const MaskShape& mask) {
    return {
        .left = mask.left,
        .top = mask.top,
        .right = mask.right,
        .bottom = mask.bottom,
        .ellipse = mask.ellipse ? 1U : 0U,
        .depth = mask.depth,
        .outside = mask.outside ? 1U : 0U,
    };
}

} // namespace kyv
