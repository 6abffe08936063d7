// Pencil sketch: the picture as a drawing in graphite on paper.
//
//   "P1"  int    stroke size 1..10
//   "P2"  byte   edge threshold 1..230: what is fainter gets no contour
//   "P3"  byte   edge intensity 20..100
//   "P4"  mask   left, top, right, bottom in fractions of the frame; all zero is the whole frame
//   "P5"  int    1 treats the ellipse inside that rectangle, any other value the rectangle
//   "P6"  float  width of the soft rim, 0..0.4 of the frame's shorter side
//   "P7"  int    non-zero treats the outside
//   "P8"  int    non-zero: strokes and grain change from frame to frame
#pragma once

#include <cstdint>

#include "effects/style/GpuPath.h"
#include "interface/HostInterface.h"

namespace kyv {

class CPencilFilter;

struct PencilSketch {
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
