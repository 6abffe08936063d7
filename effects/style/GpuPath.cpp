// The GPU path of the style effects.
#include "effects/style/GpuPath.h"

#include "platform/Library.h"

namespace kyv {
namespace {

enum Obtained : uint32_t { kCudart = 1, kBrook = 2 };

// Every lookup is made afresh: the host may have changed the library since.
void* Lookup(const EffectContext& context, const char* name) {
    return context.gpuLibrary ? FindSymbol(context.gpuLibrary, name) : nullptr;
}

// Without the entry an object that has not been handed back stays in use.
void GetWrapper(const EffectContext& context, const char* name, void*& wrapper, uint32_t& obtained,
                Obtained bit) {
    const auto get = reinterpret_cast<GpuGetWrapperFunction>(Lookup(context, name));
    if (!get) {
        return;
    }
    wrapper = get(0);
    obtained = wrapper ? obtained | bit : obtained & ~uint32_t{bit};
}

void ReleaseWrapper(const EffectContext& context, const char* name, void* wrapper) {
    if (!wrapper) {
        return;
    }
    const auto release = reinterpret_cast<GpuReleaseWrapperFunction>(Lookup(context, name));
    if (release) {
        release(wrapper);
    }
}

template <class Object>
GpuRenderFunction RenderOf(void* object) {
    const auto* table = object ? static_cast<const Object*>(object)->table : nullptr;
    return table ? table->Render : nullptr;
}

} // namespace

void BindGpu(const EffectContext& context, GpuBinding& binding) {
    binding.device = context.gpuDevice;
    GetWrapper(context, KYV_GET_CUDART_NAME, binding.cudart, binding.obtained, kCudart);
    GetWrapper(context, KYV_GET_BROOK_NAME, binding.brook, binding.obtained, kBrook);
}

void HandBackGpu(const EffectContext& context, GpuBinding& binding) {
    binding.obtained = 0;
    ReleaseWrapper(context, KYV_RELEASE_CUDART_NAME, binding.cudart);
    ReleaseWrapper(context, KYV_RELEASE_BROOK_NAME, binding.brook);
}

bool RenderOnGpu(EffectContext& context, const GpuBinding& binding, const FrameGeometry& geometry,
                 const void* input, GpuEffect effect, const void* settings, size_t settingsBytes) {
    void* object = nullptr;
    GpuRenderFunction render = nullptr;
    bool resultCounts = false;
    switch (context.gpuMode) {
    case GpuMode_DeviceA:
    case GpuMode_DeviceB:
        object = context.gpuDevice;
        render = RenderOf<GpuDevice>(object);
        break;
    case GpuMode_BrookA:
    case GpuMode_BrookB:
        object = binding.obtained & kBrook ? binding.brook : nullptr;
        render = RenderOf<GpuBrookWrapper>(object);
        break;
    case GpuMode_CudartA:
    case GpuMode_CudartB:
        object = binding.obtained & kCudart ? binding.cudart : nullptr;
        render = RenderOf<GpuCudartWrapper>(object);
        resultCounts = true;
        break;
    default:
        break;
    }
    if (!render) {
        return false;
    }
    const GpuFrame frame = {
        .byteCount = sizeof(GpuFrame),
        .effect = effect,
        .width = static_cast<uint32_t>(geometry.width),
        .height = static_cast<uint32_t>(geometry.height),
        .pitchBytes = static_cast<uint32_t>(geometry.pitchBytes),
        .pixelFormat = context.pixelFormat,
        .fieldSelector = context.fieldSelector,
        .gpuMode = context.gpuMode,
        .device = binding.device,
        .settingsBytes = static_cast<uint32_t>(settingsBytes),
        .reserved2c = 0,
    };
    const uint32_t result =
        render(object, static_cast<const uint8_t*>(input) + geometry.viewOffset,
               static_cast<uint8_t*>(context.frame) + geometry.viewOffset, &frame, settings);
    if (resultCounts && result != 0) {
        context.gpuMode = GpuMode_Processor;
        return false;
    }
    return true;
}

} // namespace kyv
