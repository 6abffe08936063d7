// Rows of V, U, Y, A to rows of B, G, R, A.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels; dst may be src itself but must not overlap it otherwise.
using ToARGBRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

void ToARGB_scalar(uint8_t* dst, const uint8_t* src, size_t count);
void ToARGB_sse2(uint8_t* dst, const uint8_t* src, size_t count);
void ToARGB_avx2(uint8_t* dst, const uint8_t* src, size_t count);

extern const KernelTable<ToARGBRow> kToARGB;

} // namespace kyv
