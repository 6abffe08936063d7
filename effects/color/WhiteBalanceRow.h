// The pixel loop of the white balance.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels of B, G, R, A through one table of 256 entries, each 0 to 255, a channel. Alpha is
// copied. dst may be src itself but must not overlap it otherwise.
using WhiteBalanceRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                                 const uint32_t* blue, const uint32_t* green, const uint32_t* red);

void WhiteBalanceRow_scalar(uint8_t* dst, const uint8_t* src, size_t count, const uint32_t* blue,
                            const uint32_t* green, const uint32_t* red);

extern const KernelTable<WhiteBalanceRow> kWhiteBalanceRow;

} // namespace kyv
