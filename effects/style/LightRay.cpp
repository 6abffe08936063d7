// The callbacks of the light ray.
#include "effects/style/LightRay.h"

#include <algorithm>

#include "effects/style/LightRayFilter.h"
#include "effects/style/StyleCall.h"

namespace kyv {
namespace {

constexpr float kFarthest = 16.0F; // frames away

float Coordinate(float value) {
    return value == value ? std::clamp(value, -kFarthest, kFarthest) : 0.0F;
}

} // namespace

void LightRay::Begin(EffectContext& context, Instance& instance) {
    context.requestB = 1;
    BindGpu(context, instance.gpu);
}

KyvStatus LightRay::Process(EffectContext& context, Instance& instance) {
    FrameGeometry geometry;
    if (!instance.input || !context.frame || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CParamReader<Param> params(context);
    const auto position = params.Floats<2>(Position);
    const GpuLightRaySettings settings = {
        .degree = std::min<uint32_t>(params.Byte(Degree), 30),
        .x = Coordinate(position[0]),
        .y = Coordinate(position[1]),
    };
    if (RenderOnGpu(context, instance.gpu, geometry, instance.input, GpuEffect_LightRay,
                    settings)) {
        return KYV_OK;
    }
    if (!instance.filter) {
        instance.filter = new CLightRayFilter;
    }
    instance.filter->Render(MakeStyleFrame(context, geometry, instance.input), settings.degree,
                            settings.x, settings.y, context.threadCount);
    return KYV_OK;
}

void LightRay::Release(EffectContext& context, Instance& instance) {
    delete instance.filter;
    instance.filter = nullptr;
    HandBackGpu(context, instance.gpu);
}

} // namespace kyv
