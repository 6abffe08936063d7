// The two bubble effects: soap bubbles that show the scene in small, and bubbles that refract it.
#pragma once

#include "interface/HostInterface.h"

namespace KYVImageUtility {
class CImageARGB;
}

namespace kyv {

class CParticleFxBubble;

struct BubbleParams {
    enum Param : uint32_t {
        MinSize, // float  smallest diameter, 0..1
        MaxSize, // float  largest diameter, 0..1; below the smallest it counts as that
        Density, // float  how often a bubble is born, 0..1: every 3000 ms to every 300 ms
        Depth,   // float  of all bubbles in stereo frames, -1..1
        ParamCount,
    };
};

struct BubbleInstance {
    void* input;
    void* output;
    CParticleFxBubble* particles;           // owned, as are the images
    KYVImageUtility::CImageARGB* body;      // in the frames' pixel format
    KYVImageUtility::CImageARGB* mask;      // only its alpha is used
    float params[BubbleParams::ParamCount]; // what the animation was last simulated with
};
static_assert(sizeof(BubbleInstance) == 56);

struct Bubble : BubbleParams {
    using Instance = BubbleInstance;
    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

struct RefractiveBubble : BubbleParams {
    using Instance = BubbleInstance;
    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
