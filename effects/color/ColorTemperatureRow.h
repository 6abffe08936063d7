// The pixel loop of the colour temperature.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// One table a channel in the order of a pixel's bytes: blue, green, red. Entries are 0 to 255.
struct ColorTables {
    uint32_t channel[3][256];
};

// count pixels of B, G, R, A. Each channel goes through the first and then the second tables;
// pixels of luma 200 and above are blended back towards their input by up to 35 / 55. Alpha is
// copied. dst may be src itself but must not overlap it otherwise.
using ColorTemperatureRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                                     const ColorTables& first, const ColorTables& second);

void ColorTemperatureRow_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                                const ColorTables& first, const ColorTables& second);

extern const KernelTable<ColorTemperatureRow> kColorTemperatureRow;

} // namespace kyv
