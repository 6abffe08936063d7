// Frame geometry from the context.
#include "interface/FrameGeometry.h"

#include <cstring>

namespace kyv {
namespace {

// What is absurd: more than this many times the view's own side and, since that may be very short,
// also more than a picture of this side and this many pixels.
constexpr int64_t kMostStretch = 16;
constexpr int64_t kLargestSide = 8192;
constexpr int64_t kMostPixels = int64_t{1} << 26;

constexpr int64_t kLeastScalable = 2;

bool IsUsable(int64_t side, int32_t ownSide, int32_t keptSide) {
    return side >= kLeastScalable && (side <= kMostStretch * ownSide ||
                                      (side <= kLargestSide && side * keptSide <= kMostPixels));
}

} // namespace

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
    geometry.level = ResolveLevel(context.cpuLevel);
    return true;
}

DisplaySize GetDisplaySize(const EffectContext& context, const FrameGeometry& geometry,
                           KeptSide kept) {
    const int32_t width = geometry.width;
    const int32_t height = geometry.height;
    const int64_t displayWidth = context.displayAspectX != 0 ? context.displayAspectX : width;
    const int64_t displayHeight = context.displayAspectY != 0 ? context.displayAspectY : height;
    if (displayWidth * height == displayHeight * width) {
        return {width, height, false};
    }
    if (kept == KeptSide::Width) {
        const int64_t side = displayHeight * width / displayWidth;
        if (IsUsable(side, height, width)) {
            return {width, static_cast<int32_t>(side), true};
        }
    } else {
        const int64_t side = displayWidth * height / displayHeight;
        if (IsUsable(side, width, height)) {
            return {static_cast<int32_t>(side), height, true};
        }
    }
    return {width, height, false};
}

KYVImageUtility::CImageARGB ViewOf(const FrameGeometry& geometry, void* frame) {
    KYVImageUtility::CImageARGB view(static_cast<uint8_t*>(frame) + geometry.viewOffset,
                                     geometry.width, geometry.height, geometry.pitchBytes);
    view.TakeCpuLevel(geometry.level);
    return view;
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
