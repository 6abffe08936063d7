// The two passes of the box blur: sums of columns that move down the image, and windows that move
// along a row of such sums.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Adds the bytes of the row that enters the window to sums and takes off those of the row that
// leaves it, for count pixels of 4 channels. Either row may be null, for a window at an edge.
using BoxColumnsRow = void (*)(uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                               size_t count);

// The windows of one row.
struct BoxWindows {
    int32_t radius;
    // For every pixel, how many pixels are inside its window, and what AverageScale gives for it.
    const int32_t* areas;
    const float* scales;
};

// count averages of 4 channels, each the window's sum over its area, truncated. sums points at the
// first pixel's column; radius + 1 columns of zeros lie before it and after the last one. The sum
// of a window must fit in 32 bits, for which a radius up to kBoxRadiusMax is sure.
using BoxAverageRow = void (*)(uint8_t* dst, const uint32_t* sums, size_t count,
                               const BoxWindows& windows);

// (2 * 2051 + 1)^2 * 255 is the last that 32 bits hold.
inline constexpr int32_t kBoxRadiusMax = 2051;

// A reciprocal for vector forms, a little below 2 / area. Half a window's sum, made a float, times
// this and truncated is the average or 1 less: the relative error is above -6 * 2^-24, which is
// less than 1 in 255, and below 0. The remainder tells which it is.
constexpr float AverageScale(int32_t area) {
    return 2.0F / static_cast<float>(area) * (1.0F - 0x1p-22F);
}

void BoxColumns_scalar(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count);
void BoxAverage_scalar(uint8_t* dst, const uint32_t* sums, size_t count, const BoxWindows& windows);

extern const KernelTable<BoxColumnsRow> kBoxColumns;
extern const KernelTable<BoxAverageRow> kBoxAverage;

} // namespace kyv
