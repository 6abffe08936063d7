// Light ray: shafts of light that stream from the bright parts of the picture.
#pragma once

#include <cstdint>

#include "effects/style/GpuPath.h"
#include "interface/HostInterface.h"

namespace kyv {

class CLightRayFilter;

struct LightRay {
    enum Param : uint32_t {
        Degree,   // byte      0..30: length and strength; 0 leaves the picture as it is
        Position, // position  the light's place in fractions of the frame; it may lie outside
        ParamCount,
    };

    struct Instance {
        void* input;
        GpuBinding gpu;
        CLightRayFilter* filter; // made with the first frame on the processor
        uint8_t reserved[416];
    };
    static_assert(sizeof(Instance) == 464);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
