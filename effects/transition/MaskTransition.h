// What the mask transitions share: a mask fitted to the frame, and frames blended through it.
#pragma once

#include <cstdint>

#include "imageutility/ImageUtility.h"
#include "interface/HostInterface.h"

namespace kyv {

class CThreadPool;

class CMaskTransition {
public:
    // Resizes a bitmap of the module to the frame's height and, by the display aspect, width.
    // False when there is no such bitmap. For a frame of no usable size the mask stays empty.
    // Throws std::bad_alloc.
    bool LoadMask(const EffectContext& context, uint16_t bitmapId);

    // Renders the call's view, in bands on the pool when there is one and the host grants two
    // threads or more. Nothing is drawn without a mask, an output, any input or a usable size; of
    // two inputs of which one is missing the other is shown as it is. Throws std::bad_alloc.
    void Render(const EffectContext& context, void* output, void* const* inputs, CThreadPool* pool);

private:
    KYVImageUtility::CImageByte m_mask;
    // The inputs in display shape, kept from frame to frame.
    KYVImageUtility::CImageARGB m_scaled[2];
};

} // namespace kyv
