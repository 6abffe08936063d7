// The mask transitions: a wipe from input 0 to input 1 where a grey-level picture says when.
//
// Low grey levels change first. The mask is fitted to the frame's display shape in
// BeginProcessing. On one thread a frame whose display aspect differs from its shape is resized to
// that shape, blended there and resized back.
#pragma once

#include "effects/transition/TransitionParams.h"
#include "interface/HostInterface.h"

namespace kyv {

class CMaskTransition;
class CThreadPool;

// Bitmap 113; on the calling thread, whatever the host's thread count.
struct TestAlpha : TransitionParams {
    struct Instance {
        void* inputs[2];
        void* output;
        CMaskTransition* mask; // owned
    };
    static_assert(sizeof(Instance) == 32);

    static constexpr uint32_t kInputCount = 2;
    static KyvStatus Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

// Bitmap 140. With a thread count of 2 or more the frame is blended in bands of rows, and then
// without any regard to the display aspect.
struct AlphaTransition : TransitionParams {
    struct Instance {
        void* inputs[2];
        void* output;
        CMaskTransition* mask; // owned
        CThreadPool* pool;     // owned
    };
    static_assert(sizeof(Instance) == 40);

    static constexpr uint32_t kInputCount = 2;
    static KyvStatus Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
