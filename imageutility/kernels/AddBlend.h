// Saturating addition of one row of pixels to another.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Adds count pixels of src, weighted by source alpha times opacity, to dst with saturation. dst may
// be src itself but must not overlap it otherwise.
using AddBlendRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity);

// Adds B, G and R; dst keeps its alpha.
KYV_FORMS(AddBlendRow, AddBlend)

// Adds all four bytes alike.
void AddBlendWithAlpha_scalar(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity);

extern const KernelTable<AddBlendRow> kAddBlend;
extern const KernelTable<AddBlendRow> kAddBlendWithAlpha;

} // namespace kyv
