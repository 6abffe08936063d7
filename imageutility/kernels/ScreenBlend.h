// Screen of two rows of pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// count pixels; dst keeps its alpha, the source's is not read. dst may be src itself but must not
// overlap it otherwise.
using ScreenBlendRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count);

void ScreenBlend_scalar(uint8_t* dst, const uint8_t* src, size_t count);
void ScreenBlend_sse2(uint8_t* dst, const uint8_t* src, size_t count);
void ScreenBlend_avx2(uint8_t* dst, const uint8_t* src, size_t count);

extern const KernelTable<ScreenBlendRow> kScreenBlend;

} // namespace kyv
