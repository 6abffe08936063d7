// Straight-alpha "over" of rows of pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels of src, their alpha scaled by the opacity, over dst, whose alpha takes part and
// grows. dst may be src itself but must not overlap it otherwise.
using CompositeOverRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity);

KYV_FORMS(CompositeOverRow, CompositeOver)

extern const KernelTable<CompositeOverRow> kCompositeOver;

} // namespace kyv
