// The box blur of a row: sums of columns move down the image, and a window moves along them.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Sums are kept in 16 bits up to a radius of kBoxRadiusMax16, for 127 * 255 fits in a signed word,
// and in 32 bits up to kBoxRadiusMax: (2 * 1450 + 1)^2 * 255, the largest sum of a window, fits in
// a signed 32-bit number.
inline constexpr int32_t kBoxRadiusMax16 = 63;
inline constexpr int32_t kBoxRadiusMax = 1450;

// Adds the bytes of the row that enters the window to sums and takes off those of the row that
// leaves it, for count pixels of 4 channels.
using BoxColumnsRow16 = void (*)(uint16_t* sums, const uint8_t* enter, const uint8_t* leave,
                                 size_t count);
using BoxColumnsRow32 = void (*)(uint32_t* sums, const uint8_t* enter, const uint8_t* leave,
                                 size_t count);

// The windows of one row. A window's area is columns * rows.
struct BoxWindows {
    int32_t radius; // 1 or more
    int32_t rows;   // inside every window
    const int32_t*
        columns; // inside the window of each pixel; 2 * radius + 1 where there are so many
    const float* reciprocals; // of columns
};

// Moves the sums as above, and gives count averages of 4 channels, each the window's sum over its
// area, truncated. sums points at the first pixel's column; radius + 1 columns of zeros lie before
// it and after the last one. dst must not overlap the rows.
using BoxBlurRow16 = void (*)(uint8_t* dst, uint16_t* sums, const uint8_t* enter,
                              const uint8_t* leave, size_t count, const BoxWindows& windows);
using BoxBlurRow32 = void (*)(uint8_t* dst, uint32_t* sums, const uint8_t* enter,
                              const uint8_t* leave, size_t count, const BoxWindows& windows);

// --- How vector forms divide, exactly

// A little less than 1 / rows. The sum in single precision, times this and the reciprocal of the
// columns, truncates to the average or 1 less, and the remainder tells which: conversion, two
// reciprocals and two products err by at most 2^-24 of the value each, together less than the
// 8 * 2^-24 that are taken off here, and 13 * 2^-24 of 255 is less than 1.
constexpr float RowScale(int32_t rows) {
    return 1.0F / static_cast<float>(rows) * (1.0F - 0x1p-21F);
}

// Up to this area, that of the largest window of 16-bit sums, sum + 0.5 times 1 / area truncates to
// the average itself. sum + 0.5 is exact and at least 0.5 / area, 3.10e-5, away from where the
// result changes; reciprocal and product err by at most 2^-23 of 255.1, 3.05e-5.
inline constexpr int32_t kSmallArea = 127 * 127;

// A factor of 32 digits, for areas from 2 on: (sum * factor) >> (32 + shift) is the average, for
// sums up to 255 * area below 2^31. The factor is 2^(32 + shift) / area, rounded up by less than 1,
// so the product is too large by less than sum; that changes nothing while sum * area < 2^(32 +
// shift), and 255 * area^2 < 2^31 * area <= 2^(32 + shift).
struct AreaReciprocal {
    uint32_t factor;
    int32_t shift;
};

constexpr AreaReciprocal ReciprocalOf(int32_t area) {
    const auto divisor = static_cast<uint32_t>(area);
    int32_t shift = 0;
    while ((uint32_t{2} << shift) < divisor) {
        ++shift;
    }
    const uint64_t unit = uint64_t{1} << (32 + shift);
    return {static_cast<uint32_t>((unit + divisor - 1) / divisor), shift};
}

// --- Forms

KYV_FORMS(BoxColumnsRow16, BoxColumns16)
KYV_FORMS(BoxColumnsRow32, BoxColumns32)
KYV_FORMS(BoxBlurRow16, BoxBlur16)
KYV_FORMS(BoxBlurRow32, BoxBlur32)

extern const KernelTable<BoxColumnsRow16> kBoxColumns16;
extern const KernelTable<BoxColumnsRow32> kBoxColumns32;
extern const KernelTable<BoxBlurRow16> kBoxBlur16;
extern const KernelTable<BoxBlurRow32> kBoxBlur32;

} // namespace kyv
