// How a style effect hands its frames to the host's GPU helper: binding to the helper library, the
// choice of the render path, and the way back to the processor.
#pragma once

#include <cstdint>

#include "interface/FrameGeometry.h"
#include "interface/GpuHelper.h"
#include "interface/HostInterface.h"

namespace kyv {

// The part of a style effect's instance data that belongs to the helper. Zero-filled is unbound.
struct GpuBinding {
    void* cudart;      // the wrapper, or null; kept after it was handed back
    void* brook;       // likewise
    void* device;      // the host's device object when the instance was prepared
    uint32_t obtained; // which wrappers a preparation got and no release gave back
    uint32_t reserved;
};
static_assert(sizeof(GpuBinding) == 32);

// At BeginProcessing. An entry that the library lacks leaves its pointer as it was, and what it
// leads to in use unless it was handed back.
void BindGpu(const EffectContext& context, GpuBinding& binding);

// At EndProcessing and DestroyInstance: hands every wrapper back whose pointer is not null, and
// leaves the pointers as they are. Every further release hands the same objects back again; hosts
// and their libraries are built for that. Only rendering through them ends here.
void HandBackGpu(const EffectContext& context, GpuBinding& binding);

// Renders from the input to the context's frame on the path that the context's gpuMode selects.
// False when the frame is to be rendered on the processor: that path is selected, the selected
// object is missing, or the Cudart render failed, in which case gpuMode is now 1.
bool RenderOnGpu(EffectContext& context, const GpuBinding& binding, const FrameGeometry& geometry,
                 const void* input, GpuEffect effect, const void* settings, size_t settingsBytes);

template <class Settings>
bool RenderOnGpu(EffectContext& context, const GpuBinding& binding, const FrameGeometry& geometry,
                 const void* input, GpuEffect effect, const Settings& settings) {
    return RenderOnGpu(context, binding, geometry, input, effect, &settings, sizeof settings);
}

} // namespace kyv
