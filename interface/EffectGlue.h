// Turns an effect's plain functions into the callbacks that the host calls.
//
// An effect is a struct with
//
//     struct Instance { void* inputs[kInputCount]; ... };   // plain, zero-filled by the host
//     enum Param : uint32_t { ..., ParamCount };             // the parameters, in table order
//     static constexpr uint32_t kInputCount = 1;             // or 2
//     static void Begin(EffectContext&, Instance&);
//     static KyvStatus Process(EffectContext&, Instance&);
//     static void Release(EffectContext&, Instance&);        // may be called again and again
//
// Begin may also return a KyvStatus. None of them sees a null context or null instance data, and
// what they throw is turned into a status here: nothing crosses the host boundary. They compute in
// the default floating-point environment, and the host finds its own as it was.
#pragma once

#include <cstring>
#include <type_traits>

#include "interface/HostInterface.h"
#include "platform/FloatEnvironment.h"

namespace kyv {

namespace glue {

// Runs a callback's body; an escaped exception becomes a status.
template <class Body>
KyvStatus Guard(Body&& body) noexcept {
    try {
        if constexpr (std::is_void_v<decltype(body())>) {
            body();
            return KYV_OK;
        } else {
            return body();
        }
    } catch (...) {
        return KYV_FAIL;
    }
}

// Runs a body of an effect's own, which computes as it always does, whatever the host's settings.
template <class Body>
KyvStatus GuardEffect(Body&& body) noexcept {
    const CFloatEnvironment environment;
    return Guard(body);
}

// The same for every effect: notify the host, then write the defaults, packed in table order.
KyvStatus InitInstance(EffectContext* context) noexcept;

} // namespace glue

template <class Effect>
struct EffectGlue {
    using Instance = typename Effect::Instance;
    static_assert(std::is_trivially_copyable_v<Instance> && std::is_standard_layout_v<Instance>,
                  "the host allocates instance data as zero-filled bytes");
    static_assert(Effect::kInputCount == 1 || Effect::kInputCount == 2);

    static Instance* Data(EffectContext& context) {
        return static_cast<Instance*>(context.instanceData);
    }

    static KyvStatus Release(EffectContext* context) noexcept {
        if (!context) {
            return KYV_FAIL;
        }
        if (!context->instanceData) {
            return KYV_OK;
        }
        return glue::GuardEffect([&] { return Effect::Release(*context, *Data(*context)); });
    }

    static KyvStatus SetInputFrame(uint32_t index, EffectContext* context) noexcept {
        if (!context || !context->instanceData) {
            return KYV_FAIL;
        }
        // The input pointers lead every effect's instance data.
        const size_t slot = Effect::kInputCount == 2 && index != 0 ? 1 : 0;
        std::memcpy(static_cast<uint8_t*>(context->instanceData) + slot * sizeof(void*),
                    &context->frame, sizeof(void*));
        return KYV_OK;
    }

    static KyvStatus ProcessFrame(EffectContext* context) noexcept {
        if (!context || !context->instanceData) {
            return KYV_FAIL;
        }
        return glue::GuardEffect([&] { return Effect::Process(*context, *Data(*context)); });
    }

    static KyvStatus BeginProcessing(EffectContext* context) noexcept {
        if (!context || !context->instanceData) {
            return KYV_FAIL;
        }
        return glue::GuardEffect([&] { return Effect::Begin(*context, *Data(*context)); });
    }

    // EndProcessing and DestroyInstance are one routine.
    static constexpr EffectCallbacks kCallbacks = {
        .InitInstance = glue::InitInstance,
        .DestroyInstance = Release,
        .SetInputFrame = SetInputFrame,
        .ProcessFrame = ProcessFrame,
        .reserved20 = nullptr,
        .BeginProcessing = BeginProcessing,
        .EndProcessing = Release,
        .reserved38 = nullptr,
        .reserved40 = nullptr,
    };
};

} // namespace kyv
