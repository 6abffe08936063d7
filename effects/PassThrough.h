// An effect that obeys the whole calling protocol and copies its first input to the output.
#pragma once

#include "interface/HostInterface.h"

namespace kyv {

enum PassThroughRequests : uint32_t { kRequestNone = 0, kRequestA = 1, kRequestB = 2 };

// Sets the context's request flags that are named in the mask.
void SetRequests(EffectContext& context, uint32_t requests);

// Copies the call's view. KYV_FAIL without an input, an output or a usable size.
KyvStatus PassFrame(const EffectContext& context, const void* input);

template <uint32_t InstanceBytes, uint32_t Inputs, uint32_t Requests>
struct PassThrough {
    struct Instance {
        void* inputs[Inputs];
        uint8_t unused[InstanceBytes - Inputs * sizeof(void*)];
    };
    static_assert(sizeof(Instance) == InstanceBytes);

    static constexpr uint32_t kInputCount = Inputs;

    static void Begin(EffectContext& context, Instance&) { SetRequests(context, Requests); }
    static KyvStatus Process(EffectContext& context, Instance& instance) {
        return PassFrame(context, instance.inputs[0]);
    }
    static void Release(EffectContext&, Instance&) {}
};

} // namespace kyv
