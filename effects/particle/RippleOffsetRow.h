// How far a ripple moves the pixels of one row.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

struct RippleShape {
    float radius; // all in pixels but the phase, in radians
    float wavelength;
    float amplitude;
    float phase;
};

// Columns at distance 0, 1, ... count - 1 from the ripple's centre, in a row at distance dy.
// offsets[dx] = weight / radius * amplitude * sin(d / wavelength * 2 pi + phase), where d is the
// distance of the pixel and weight what is left of the radius beyond it, 0 outside. Every operation
// is rounded to single precision. dx^2 + dy^2 must stay below 2^31.
using RippleOffsetRow = void (*)(float* offsets, size_t count, int32_t dy,
                                 const RippleShape& shape);

KYV_FORMS(RippleOffsetRow, RippleOffsetRow)

extern const KernelTable<RippleOffsetRow> kRippleOffsetRow;

// The sine of the scalar form.
float RippleSine(float angle);

} // namespace kyv
