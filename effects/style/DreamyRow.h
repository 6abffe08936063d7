// Lays softness and glow over a row.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// All 0..256.
struct DreamyMix {
    uint16_t soft;  // part of the softened picture where the source is white
    uint16_t glow;  // part of the glow that is laid over it
    uint16_t depth; // how far the picture below moves towards its square, which deepens colours and
                    // makes up for the veil that the glow is
};

// count pixels of B, G, R, A. soft is the blurred picture, glow its blurred highlights. The source
// moves towards the softened picture, less where it is dark, is deepened, and the glow is screened
// over it, which brightens and never clips. Alpha is the source's. dst may be any of the three.
using DreamyRow = void (*)(uint8_t* dst, const uint8_t* src, const uint8_t* soft,
                           const uint8_t* glow, size_t count, const DreamyMix& mix);

KYV_FORMS(DreamyRow, DreamyRow)

extern const KernelTable<DreamyRow> kDreamyRow;

} // namespace kyv
