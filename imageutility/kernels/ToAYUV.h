// Rows of B, G, R, A to rows of V, U, Y, A.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels; dst may be src itself but must not overlap it otherwise.
using ToAYUVRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

KYV_FORMS(ToAYUVRow, ToAYUV)

extern const KernelTable<ToAYUVRow> kToAYUV;

} // namespace kyv
