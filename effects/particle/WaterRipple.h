// The water ripple effect.
#pragma once

#include "interface/HostInterface.h"

namespace KYVImageUtility {
class CImageARGB;
}

namespace kyv {

class CParticleFxWaterripple;

struct WaterRipple {
    enum Param : uint32_t {
        Density, // float  how often a ripple is born, 0..1: every 1500 ms to every 500 ms
        ParamCount,
    };

    struct Instance {
        void* input;
        void* output;
        CParticleFxWaterripple* particles;  // owned, as is the image
        KYVImageUtility::CImageARGB* sheen; // B, G, R, A
        float params[ParamCount];           // what the animation was last simulated with
    };
    static_assert(sizeof(Instance) == 40);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
