// Rows of V, U, Y, A to rows of B, G, R, A.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels; dst may be src itself but must not overlap it otherwise.
using ToARGBRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

KYV_FORMS(ToARGBRow, ToARGB)

extern const KernelTable<ToARGBRow> kToARGB;

} // namespace kyv
