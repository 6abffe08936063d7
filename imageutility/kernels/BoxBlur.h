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
    int32_t radius; // 1 to kBoxRadiusMax
    // For every pixel, how many pixels are inside its window, and AverageScale of that. From radius
    // to count - radius, where whole windows fit, all are alike.
    const int32_t* areas;
    const float* scales;
};

// count averages of 4 channels, each the window's sum over its area, truncated. sums points at the
// first pixel's column; radius + 1 columns of zeros lie before it and after the last one.
using BoxAverageRow = void (*)(uint8_t* dst, const uint32_t* sums, size_t count,
                               const BoxWindows& windows);

// (2 * 1450 + 1)^2 * 255 is the largest sum of a window that a signed 32-bit number holds.
inline constexpr int32_t kBoxRadiusMax = 1450;

// A little less than 1 / area, for vector forms: the sum in single precision times this, truncated,
// is the average or 1 less, and the remainder tells which. Each of conversion, reciprocal and
// product errs by at most 2^-24 of the value, together less than is taken off here; and 7 * 2^-24
// of 255 is less than 1.
constexpr float AverageScale(int32_t area) {
    return 1.0F / static_cast<float>(area) * (1.0F - 0x1p-22F);
}

// Up to this area of a window, (sum + 0.5) * (1 / area) truncates to the average in single
// precision. sum + 0.5 is exact, and at least 0.5 / area, 3.10e-5, away from where the integers
// change; reciprocal and product err by at most 2^-23 of 255.1, 3.05e-5.
inline constexpr int32_t kSmallArea = 127 * 127;

void BoxColumns_scalar(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count);
void BoxColumns_avx2(uint32_t* sums, const uint8_t* enter, const uint8_t* leave, size_t count);
void BoxAverage_scalar(uint8_t* dst, const uint32_t* sums, size_t count, const BoxWindows& windows);
void BoxAverage_avx2(uint8_t* dst, const uint32_t* sums, size_t count, const BoxWindows& windows);

extern const KernelTable<BoxColumnsRow> kBoxColumns;
extern const KernelTable<BoxAverageRow> kBoxAverage;

} // namespace kyv
