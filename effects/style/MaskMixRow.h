// Mixes a treated row into the source by a mask.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels of 4 channels: each the mix of src and effect by the pixel's weight, 0 keeps src and
// 255 takes effect, rounded. Alpha is mixed like a colour. dst may be either.
using MaskMixRow = void (*)(uint8_t* dst, const uint8_t* src, const uint8_t* effect,
                            const uint8_t* weights, size_t count);

KYV_FORMS(MaskMixRow, MaskMixRow)

extern const KernelTable<MaskMixRow> kMaskMixRow;

} // namespace kyv
