// The callbacks of the dreamy effect.
#include "effects/style/Dreamy.h"

#include <algorithm>

#include "effects/style/DreamyFilter.h"
#include "effects/style/StyleCall.h"

namespace kyv {

void Dreamy::Begin(EffectContext& context, Instance& instance) {
    BindGpu(context, instance.gpu);
}

KyvStatus Dreamy::Process(EffectContext& context, Instance& instance) {
    FrameGeometry geometry;
    if (!instance.input || !context.frame || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CParamReader<Param> params(context);
    const MaskShape mask = ReadMask(params);
    const uint32_t degree = std::clamp<uint32_t>(params.Byte(Degree), 1, 40);
    const GpuDreamySettings settings = {
        .mask = ToGpuMask(mask),
        .degree = degree,
        .variant = context.gpuVariant <= 3 ? context.gpuVariant : 0,
    };
    if (RenderOnGpu(context, instance.gpu, geometry, instance.input, GpuEffect_Dreamy, settings)) {
        return KYV_OK;
    }
    if (!instance.filter) {
        instance.filter = new CDreamyFilter;
    }
    instance.filter->Render(MakeStyleFrame(context, geometry, instance.input), degree, mask);
    return KYV_OK;
}

void Dreamy::Release(EffectContext& context, Instance& instance) {
    delete instance.filter;
    instance.filter = nullptr;
    HandBackGpu(context, instance.gpu);
}

} // namespace kyv
