// Scaling the colours of a row about the middle.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// B, G and R of count pixels are scaled about 128 by factor / 4096, rounded and clamped; alpha is
// kept. factor is 0..8192.
using ContrastRow = void (*)(uint8_t* pixels, size_t count, int32_t factor);

KYV_FORMS(ContrastRow, Contrast)

extern const KernelTable<ContrastRow> kContrast;

} // namespace kyv
