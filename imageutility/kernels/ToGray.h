// Luma of rows of B, G, R, A: into the pixels themselves, or as a row of bytes.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// B, G and R of count pixels become their luma; alpha is kept.
using ToGrayRow = void (*)(uint8_t* pixels, size_t count);
// count bytes of luma; dst and src must not overlap.
using ToGrayBytesRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

KYV_FORMS(ToGrayRow, ToGray)
KYV_FORMS(ToGrayBytesRow, ToGrayBytes)

extern const KernelTable<ToGrayRow> kToGray;
extern const KernelTable<ToGrayBytesRow> kToGrayBytes;

} // namespace kyv
