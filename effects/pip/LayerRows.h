// Rows of the passes that make the layers: keying, two-colour gradients.
//
// Pixels are 4 bytes with alpha last; those with alpha other than 0 are covered.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Keys a colour out of count pixels. A pixel matches when each of its B, G and R differs from the
// key's by at most the tolerance. The alpha of a covered pixel becomes 64 for each of the 2 x 2
// pixels that begin with it, in this row and the one below, that does not match, at most 255. The
// last pixel stands in for its right neighbour. key is 0x00RRGGBB; below may be the row itself.
using ColorKeyRow = void (*)(uint8_t* pixels, const uint8_t* below, size_t count, uint32_t key,
                             uint8_t tolerance);

KYV_FORMS(ColorKeyRow, ColorKeyRow)

extern const KernelTable<ColorKeyRow> kColorKeyRow;

// Recolours covered pixels; alpha is kept. top holds four floats a pixel, B, G, R and one that does
// not count, for the upper side of the gradient's rectangle, and rise what to add on the way to the
// lower side, of which `part` is gone. The sum is truncated and clamped to 0..255.
using GradientRow = void (*)(uint8_t* pixels, const float* top, const float* rise, size_t count,
                             float part);

KYV_FORMS(GradientRow, GradientRow)

extern const KernelTable<GradientRow> kGradientRow;

} // namespace kyv
