// Pencil sketch: the picture as a drawing in graphite on paper.
#pragma once

#include <cstdint>

#include "effects/style/GpuPath.h"
#include "interface/HostInterface.h"

namespace kyv {

class CPencilFilter;

struct PencilSketch {
    enum Param : uint32_t {
        StrokeSize,    // int    1..10
        EdgeThreshold, // byte   1..230: what is fainter gets no contour
        EdgeIntensity, // byte   20..100
        MaskRect,      // rect   left, top, right, bottom in fractions of the frame; all zero is the
                       // whole frame
        MaskType,      // int    1 treats the ellipse inside that rectangle, any other value the
                       // rectangle
        MaskDepth,     // float  width of the soft rim, 0..0.4 of the frame's shorter side
        MaskInverse,   // int    non-zero treats the outside
        Random,        // int    non-zero: strokes and grain change from frame to frame
        ParamCount,
    };

    struct Instance {
        void* input;
        GpuBinding gpu;
        CPencilFilter* filter; // made with the first frame on the processor
        uint32_t randomSeed;   // the context's at BeginProcessing
        uint8_t reserved[44];
    };
    static_assert(sizeof(Instance) == 96);

    static constexpr uint32_t kInputCount = 1;
    static void Begin(EffectContext& context, Instance& instance);
    static KyvStatus Process(EffectContext& context, Instance& instance);
    static void Release(EffectContext& context, Instance& instance);
};

} // namespace kyv
