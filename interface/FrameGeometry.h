// Where the pixels of a call lie in the host's frames.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/ImageUtility.h"
#include "interface/HostInterface.h"

namespace kyv {

// Frames are 4 bytes a pixel. A side-by-side frame has rows of two views.
struct FrameGeometry {
    int32_t width;       // pixels of the view that this call treats
    int32_t height;      // rows
    int32_t pitchBytes;  // from row to row of the frame
    int32_t viewOffset;  // bytes from a row's start to the view's first pixel
    uint32_t layout;     // a StereoLayout; unknown values count as Mono
    size_t frameBytes;   // the whole frame, both views
    ResolvedLevel level; // of the call
};

// The largest side of a frame, in pixels. Beyond it a size is nonsense, and the arithmetic of
// pitches and positions has room below it.
inline constexpr uint32_t kMaxFrameSide = 1u << 20;

// False when the context's width or height is 0 or beyond kMaxFrameSide.
bool GetFrameGeometry(const EffectContext& context, FrameGeometry& geometry);

// The view's size with square pixels on the display that the context tells of.
struct DisplaySize {
    int32_t width;
    int32_t height;
    bool differs; // in aspect, even where the division gives the view's own size
};

enum class KeptSide {
    Width,
    Height,
};

// One side of the view stays and the other follows the display's aspect, a zero term of which
// stands for the view's own side: display width * height / display height, or the other way round,
// truncated. An aspect that leaves less than 2 pixels, which cannot be scaled, or makes an absurdly
// large picture, counts as the view's own.
DisplaySize GetDisplaySize(const EffectContext& context, const FrameGeometry& geometry,
                           KeptSide kept);

// The view of the call in one of the host's frames, as an image of the call's level. Its bytes
// are those of the frame's format.
KYVImageUtility::CImageARGB ViewOf(const FrameGeometry& geometry, void* frame);

// Copies the view of the call from one frame to another of the same geometry. The frames may be
// one and the same, but must not overlap otherwise.
void CopyView(const FrameGeometry& geometry, void* output, const void* input);

} // namespace kyv
