// An operation whose forms tell which instruction set each was compiled for, and for how wide a
// vector: what a table made like all others really holds.
#pragma once

#include <cstddef>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

struct SetProbeResult {
    InstructionSet set; // as far as the compiler was allowed to go
    size_t vectorBytes; // 0 in the scalar form
};

// Runs on any processor: it only returns constants.
using SetProbeRow = SetProbeResult (*)();

KYV_FORMS(SetProbeRow, SetProbe)

} // namespace kyv
