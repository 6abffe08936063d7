// One row of pixels over another.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels of src over dst, weighted by source alpha times opacity; dst keeps its alpha. dst
// may be src itself but must not overlap it otherwise.
using AlphaBlendRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity);

KYV_FORMS(AlphaBlendRow, AlphaBlend)

extern const KernelTable<AlphaBlendRow> kAlphaBlend;

} // namespace kyv
