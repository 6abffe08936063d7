// The callbacks of the pencil sketch.
#include "effects/style/PencilSketch.h"

#include <algorithm>

#include "effects/style/PencilFilter.h"
#include "effects/style/StyleCall.h"

namespace kyv {
namespace {

// Mixes all bits of a number into all bits of the result.
constexpr uint64_t Mix(uint64_t value) {
    value = (value ^ value >> 30) * 0xBF58476D1CE4E5B9U;
    value = (value ^ value >> 27) * 0x94D049BB133111EBU;
    return value ^ value >> 31;
}

// Depends on seed and position alone, so that a frame sought looks like the frame played. Not 0,
// which is the texture that stands still.
uint32_t TextureOf(uint32_t seed, int64_t position) {
    return static_cast<uint32_t>(Mix(static_cast<uint64_t>(position) + Mix(seed + 1U))) | 1;
}

} // namespace

void PencilSketch::Begin(EffectContext& context, Instance& instance) {
    instance.randomSeed = context.randomSeed;
    BindGpu(context, instance.gpu);
}

KyvStatus PencilSketch::Process(EffectContext& context, Instance& instance) {
    FrameGeometry geometry;
    if (!instance.input || !context.frame || !GetFrameGeometry(context, geometry)) {
        return KYV_FAIL;
    }
    const CParamReader<Param> params(context);
    const MaskShape mask = ReadMask(params);
    const GpuPencilSketchSettings settings = {
        .mask = ToGpuMask(mask),
        .strokeSize = static_cast<uint32_t>(std::clamp(params.Int(StrokeSize), 1, 10)),
        .edgeThreshold = std::clamp<uint32_t>(params.Byte(EdgeThreshold), 1, 230),
        .edgeIntensity = std::clamp<uint32_t>(params.Byte(EdgeIntensity), 20, 100),
        .texture = params.Int(Random) != 0 ? TextureOf(instance.randomSeed, context.position) : 0,
    };
    if (RenderOnGpu(context, instance.gpu, geometry, instance.input, GpuEffect_PencilSketch,
                    settings)) {
        return KYV_OK;
    }
    if (!instance.filter) {
        instance.filter = new CPencilFilter;
    }
    instance.filter->Render(MakeStyleFrame(context, geometry, instance.input),
                            {static_cast<int32_t>(settings.strokeSize), settings.edgeThreshold,
                             settings.edgeIntensity, settings.texture},
                            mask);
    return KYV_OK;
}

void PencilSketch::Release(EffectContext& context, Instance& instance) {
    delete instance.filter;
    instance.filter = nullptr;
    HandBackGpu(context, instance.gpu);
}

} // namespace kyv
