// White balance: makes a reference colour neutral grey while black stays black.
#pragma once

#include <cstdint>

#include "interface/HostInterface.h"

namespace kyv {

struct WhiteBalance {
    enum Param : uint32_t {
        ReferencePoint, // colour  white changes nothing
        Comparison,     // int     non-zero leaves the left half unprocessed
        ParamCount,
    };

    struct Instance {
        void* input;
        void* output;
        uint32_t red[256];
        uint32_t green[256];
        uint32_t blue[256];
        uint32_t reference; // the colour the tables were built for
        void* reserved;     // null: the work needs no buffer
        uint32_t reservedSize;
    };
    static_assert(sizeof(Instance) == 3112);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
