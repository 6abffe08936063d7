// The glow of a picture, and how it is laid over a row.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

struct DreamyMix {
    uint16_t soft;  // part of the softened picture, 1..256
    uint16_t glow;  // part of the glow that is laid over it, 0..256
    uint16_t depth; // how far black would be deepened, 0..256; white is not
};

// count pixels of B, G, R, A of a veil, from the blurred picture and its blurred lights: in B, G
// and R what a row takes on, in A the share of itself, in 1/256, that it keeps. On a flat picture
// both make up soft, deepened where it is dark, with the glow, faint glow threefold, added in the
// room that is left, half-way between that of the channel and that of the strongest one, which
// keeps the colour. dst may be either.
using DreamyVeilRow = void (*)(uint8_t* dst, const uint8_t* soft, const uint8_t* glow, size_t count,
                               const DreamyMix& mix);

// count pixels of B, G, R, A: each channel times the share that it keeps, and the veil added, as
// far as the pixel is no deep shadow: black takes a quarter of it, what has a strongest channel of
// 96 or more all of it. Alpha is the source's. dst may be either.
using DreamyRow = void (*)(uint8_t* dst, const uint8_t* src, const uint8_t* veil, size_t count);

// What black takes of the veil, in 1/255, and how much more for every level.
inline constexpr uint8_t kShadowTakes = 64;
inline constexpr uint8_t kShadowTakesPerLevel = 2;

KYV_FORMS(DreamyVeilRow, DreamyVeilRow)
KYV_FORMS(DreamyRow, DreamyRow)

extern const KernelTable<DreamyVeilRow> kDreamyVeilRow;
extern const KernelTable<DreamyRow> kDreamyRow;

} // namespace kyv
