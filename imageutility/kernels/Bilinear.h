// The two halves of bilinear resizing: along a row, and between two rows.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Where the pixels of a destination row come from. Every neighbour pair lies inside the source row.
struct BilinearColumns {
    const int32_t* left;    // for every destination pixel, the left one of two source pixels
    const uint8_t* weights; // and the weights of both in 1/128: 128 - f, f; f is 0..127
    // For each two of the first pixels, 16 indices into the four source pixels from the first's
    // left one on: the bytes of both their neighbour pairs, interleaved. An even number of pixels
    // have them; vector forms need not use them.
    const uint8_t* shuffles = nullptr;
    size_t shuffled = 0;
};

// count pixels: each channel is a + (((b - a) * f) >> 7), rounded toward minus infinity, of two
// neighbours of src. dst and src must not overlap.
using BilinearRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                             const BilinearColumns& columns);

// The same between count pixels of two rows, with one fraction 0..127 for all. dst may be either
// row but must not overlap them otherwise.
using LerpRow = void (*)(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
                         uint32_t fraction);

KYV_FORMS(BilinearRow, Bilinear)
KYV_FORMS(LerpRow, Lerp)

extern const KernelTable<BilinearRow> kBilinear;
extern const KernelTable<LerpRow> kLerp;

} // namespace kyv
