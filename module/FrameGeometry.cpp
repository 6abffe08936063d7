// Frame geometry from the context.
#include "module/FrameGeometry.h"

#include <cstring>

namespace kyv {

bool GetFrameGeometry(const EffectContext& context, FrameGeometry& geometry) {
    if (context.width == 0 || context.height == 0 || context.width > kMaxFrameSide ||
        context.height > kMaxFrameSide) {
        return false;
    }
    const bool stereo = context.stereoLayout == StereoLayout_LeftHalf ||
                        context.stereoLayout == StereoLayout_RightHalf;
    const int32_t viewBytes = static_cast<int32_t>(context.width) * 4;
    geometry.width = static_cast<int32_t>(context.width);
    geometry.height = static_cast<int32_t>(context.height);
    geometry.pitchBytes = stereo ? viewBytes * 2 : viewBytes;
    geometry.viewOffset = context.stereoLayout == StereoLayout_RightHalf ? viewBytes : 0;
    geometry.layout = stereo ? context.stereoLayout : uint32_t{StereoLayout_Mono};
    geometry.frameBytes = static_cast<size_t>(geometry.pitchBytes) * context.height;
    return true;
}

void CopyView(const FrameGeometry& geometry, void* output, const void* input) {
    if (output == input) {
        return;
    }
    auto* to = static_cast<uint8_t*>(output) + geometry.viewOffset;
    const auto* from = static_cast<const uint8_t*>(input) + geometry.viewOffset;
    for (int32_t y = 0; y < geometry.height; ++y) {
        std::memcpy(to, from, static_cast<size_t>(geometry.width) * 4);
        to += geometry.pitchBytes;
        from += geometry.pitchBytes;
    }
}

} // namespace kyv
