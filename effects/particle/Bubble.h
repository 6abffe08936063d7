// The two bubble effects: soap bubbles that show the scene in small, and bubbles that refract it.
//
//   "P1"  float  smallest diameter, 0..1
//   "P2"  float  largest diameter, 0..1; below P1 it counts as P1
//   "P3"  float  how often a bubble is born, 0..1: every 3000 ms to every 300 ms
//   "P4"  float  depth of all bubbles in stereo frames, -1..1
#pragma once

#include "interface/HostInterface.h"

namespace KYVImageUtility {
class CImageARGB;
}

namespace kyv {

class CParticleFxBubble;

struct BubbleInstance {
    void* input;
    void* output;
    CParticleFxBubble* particles;      // owned, as are the images
    KYVImageUtility::CImageARGB* body; // in the frames' pixel format
    KYVImageUtility::CImageARGB* mask; // only its alpha is used
    float params[4];                   // what the animation was last simulated with
};
static_assert(sizeof(BubbleInstance) == 56);

struct Bubble {
    using Instance = BubbleInstance;
    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

struct RefractiveBubble {
    using Instance = BubbleInstance;
    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
