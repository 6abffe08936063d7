// The steps that smear light along rays.
//
// Light is held with 16 bits a channel, 4 channels a pixel, so that what many steps round off is
// never seen.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels of B, G, R, A become light: every channel, scaled to 16 bits, times the pixel's
// shadow in 1/65536, cut off. dst must not overlap.
using RayShadeRow = void (*)(uint16_t* dst, const uint8_t* src, const uint16_t* shadows,
                             size_t count);

// count words between two rows: (a * (65535 - fraction) >> 16) + (b * fraction >> 16), which loses
// at most 2. dst may be either row.
using RayLerpRow = void (*)(uint16_t* dst, const uint16_t* upper, const uint16_t* lower,
                            size_t count, uint16_t fraction);

// Where a step finds the light that it brings to each pixel of a row.
struct RayColumns {
    const int32_t* left;       // the left one of two neighbours in the row
    const uint16_t* fractions; // of the way to the right one, in 1/65536
};

// Shares of the mean in 1/65536: what a pixel keeps, and what is brought to it.
struct RayShares {
    uint16_t kept;
    uint16_t brought;
};

// count pixels: dst = (src * kept >> 16) + (moved * brought >> 16), where moved lies between two
// neighbours of row as in RayLerpRow. dst may be src but must not overlap row.
using RayStepRow = void (*)(uint16_t* dst, const uint16_t* src, const uint16_t* row, size_t count,
                            const RayColumns& columns, const RayShares& shares);

// count pixels of B, G, R, A: light, in 8 bits, times the room that is left is added. The room lies
// half-way between that of the channel itself and that of the pixel's strongest channel: nothing
// clips, and a full channel does not take the colour from the light that falls on it. What is dark
// stands before the light and takes less: a sixth of it where the strongest channel is 0, all of it
// from 107 on. Alpha is the source's. dst may be either.
using RayAddRow = void (*)(uint8_t* dst, const uint8_t* src, const uint8_t* light, size_t count);

// What black takes of the light, in 1/255, and how much more for every level.
inline constexpr uint8_t kBlackTakes = 40;
inline constexpr uint8_t kTakesPerLevel = 2;

KYV_FORMS(RayShadeRow, RayShadeRow)
KYV_FORMS(RayLerpRow, RayLerpRow)
KYV_FORMS(RayStepRow, RayStepRow)
KYV_FORMS(RayAddRow, RayAddRow)

extern const KernelTable<RayShadeRow> kRayShadeRow;
extern const KernelTable<RayLerpRow> kRayLerpRow;
extern const KernelTable<RayStepRow> kRayStepRow;
extern const KernelTable<RayAddRow> kRayAddRow;

} // namespace kyv
