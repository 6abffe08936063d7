// Setting some of the bytes of every pixel of a row.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// Each of count pixels, as a word 0xAARRGGBB, becomes (pixel & keep) | value.
using FillMaskedRow = void (*)(uint8_t* pixels, size_t count, uint32_t keep, uint32_t value);

KYV_FORMS(FillMaskedRow, FillMasked)

extern const KernelTable<FillMaskedRow> kFillMasked;

} // namespace kyv
