// The bilinear reading of a picture through map entries.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// A picture of B, G, R, A (or V, U, Y, A) to read from.
struct SamplePicture {
    const uint8_t* pixels;
    ptrdiff_t pitch; // bytes
    int32_t width;
    int32_t height;
};

// Draws count pixels through their map entries: u in the low 16 bits, v in the high ones, in 1/64
// pixel. Pixels whose right or lower neighbour is not in the picture are left as they are; the
// others become opaque.
//
// The interpolation takes half of the fraction, in both directions: (fraction << 9) >> 16 of the
// difference. Intended.
using QuadSampleRow = void (*)(uint8_t* dst, const uint32_t* map, size_t count,
                               const SamplePicture& picture);

KYV_FORMS(QuadSampleRow, QuadSampleRow)

extern const KernelTable<QuadSampleRow> kQuadSampleRow;

} // namespace kyv
