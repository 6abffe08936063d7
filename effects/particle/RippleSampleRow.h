// Reads a row of pixels from moved places between the pixels of a picture.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// A picture of B, G, R, A with one more column and one more row than are shown. The places that are
// read never lie beyond the last shown pixel; what follows it is read with weight 0.
struct RipplePicture {
    const uint8_t* pixels;
    ptrdiff_t pitchBytes;
    int32_t width; // shown
    int32_t height;
};

// dst[i] is the picture at (x + i, y) plus offsets[i] in both directions, kept inside. Bilinear
// with 16 bits of fraction, every interpolation rounded towards minus infinity. Alpha becomes 255.
using RippleSampleRow = void (*)(uint8_t* dst, const RipplePicture& picture, int32_t x, int32_t y,
                                 const float* offsets, size_t count);

KYV_FORMS(RippleSampleRow, RippleSampleRow)

extern const KernelTable<RippleSampleRow> kRippleSampleRow;

} // namespace kyv
