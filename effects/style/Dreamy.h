// Dreamy: a soft glow over the picture, or a part of it.
#pragma once

#include <cstdint>

#include "effects/style/GpuPath.h"
#include "interface/HostInterface.h"

namespace kyv {

class CDreamyFilter;

struct Dreamy {
    enum Param : uint32_t {
        Degree,      // byte   1..40: strength and radius of the glow
        MaskRect,    // rect   left, top, right, bottom in fractions of the frame; all zero is the
                     // whole frame
        MaskType,    // int    1 treats the ellipse inside that rectangle, any other value the
                     // rectangle
        MaskDepth,   // float  width of the soft rim, 0..0.4 of the frame's shorter side
        MaskInverse, // int    non-zero treats the outside
        ParamCount,
    };

    struct Instance {
        void* input;
        GpuBinding gpu;
        CDreamyFilter* filter; // made with the first frame on the processor
    };
    static_assert(sizeof(Instance) == 48);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
