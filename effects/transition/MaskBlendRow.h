// The pixel loop of the mask transitions.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// What becomes of a pixel, by the mask's value there. Four equal or four different factors a value,
// in the order of the pixel's bytes, so that vector forms load them as they are.
//
// x = (picture1 * w + picture0 * (255 - w)) >> 8 for weights 1..254, where alpha is the greater of
// the two; the weights 0 and 256 take all four bytes of picture 0 and 1 as they are. Then the edge
// colour: (x * keep + edge) >> 8, where keep 256 and edge 0 change nothing. Alpha always has these.
struct MaskBlend {
    uint16_t weight[256][4];
    uint16_t keep[256][4]; // read only when hasEdge
    uint16_t edge[256][4];
    bool hasEdge;
    // The values that need no table, as most of a frame: picture 0 from picture0From (0..256) on,
    // picture 1 up to picture1UpTo (-1..255).
    int32_t picture0From;
    int32_t picture1UpTo;
};

// count pixels of 4 bytes and mask values of 1. dst may be a picture itself but must not overlap
// it otherwise.
using MaskBlendRow = void (*)(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                              const uint8_t* mask, size_t count, const MaskBlend& blend);

KYV_FORMS(MaskBlendRow, MaskBlendRow)

extern const KernelTable<MaskBlendRow> kMaskBlendRow;

} // namespace kyv
