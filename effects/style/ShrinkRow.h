// Shrinking by powers of two: rows are added up, and the sums averaged over squares of pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// The squares' sides are at most 16 pixels, so that 16 bits hold a sum: 255 * 16 * 16 = 65280.
inline constexpr int32_t kMostShrinkBits = 4;

// sums[i] += src[i], for count bytes.
using AddRow = void (*)(uint16_t* sums, const uint8_t* src, size_t count);

// count pixels of 4 channels, each the rounded average of 1 << bits neighbouring pixels of sums of
// 1 << bits rows.
using AverageRow = void (*)(uint8_t* dst, const uint16_t* sums, size_t count, int32_t bits);

KYV_FORMS(AddRow, AddRow)
KYV_FORMS(AverageRow, AverageRow)

extern const KernelTable<AddRow> kAddRow;
extern const KernelTable<AverageRow> kAverageRow;

} // namespace kyv
