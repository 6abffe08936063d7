// Keeps what shines in a row and darkens the rest.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// By StyleBrightness.
struct Highlight {
    uint8_t floor;  // what is not brighter becomes black; 0..254
    uint16_t slope; // rise of the weight above the floor, in 1/16: (brightness - floor) * slope
                    // shifted right by 4, at most 255; 1..256
};

// count pixels of B, G, R, A: every channel times the square of the weight, alpha becomes 0. dst
// may be src.
using HighlightRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                              const Highlight& highlight);

KYV_FORMS(HighlightRow, HighlightRow)

extern const KernelTable<HighlightRow> kHighlightRow;

} // namespace kyv
