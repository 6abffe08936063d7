// How long an effect takes for a frame.
#pragma once

#include <vector>

#include "host/Render.h"

namespace kyvhost {

struct BenchOptions {
    StageOptions stage;
    EffectSettings settings; // its level does not count
    std::vector<int32_t> levels = {CpuLevel_Scalar, CpuLevel_Sse2, CpuLevel_Avx2};
    Size size = {1920, 1080};
    int rounds = 0; // frames a level; 0: about two seconds for each
    bool json = false;
};

// Prints the median time of a frame at every level beside that of a memcpy of the frame. All take
// turns in one run, so that a busy or throttled machine slows them alike.
void Bench(const ModuleDescriptor& module, const BenchOptions& options);

} // namespace kyvhost
