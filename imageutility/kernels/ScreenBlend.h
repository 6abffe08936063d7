// Screen of two rows of pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels; dst keeps its alpha, the source's is not read. dst may be src itself but must not
// overlap it otherwise.
using ScreenBlendRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

KYV_FORMS(ScreenBlendRow, ScreenBlend)

extern const KernelTable<ScreenBlendRow> kScreenBlend;

} // namespace kyv
