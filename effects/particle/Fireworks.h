// The fireworks effect.
#pragma once

#include "interface/HostInterface.h"

namespace kyv {

class CParticleFxFireworks;

struct Fireworks {
    enum Param : uint32_t {
        Size,    // float  how far the sparks of a shell fly, 0..1
        Density, // float  how often a shell bursts, 0..1: every 2300 ms to every 300 ms
        Depth,   // float  in stereo frames, -1..1
        ParamCount,
    };

    struct Instance {
        void* input;
        void* output;
        CParticleFxFireworks* particles; // owned
        float params[ParamCount];        // what the animation was last simulated with
    };
    static_assert(sizeof(Instance) == 40);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
