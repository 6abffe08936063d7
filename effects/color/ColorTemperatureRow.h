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

// Tables together with the gains that they were made of. Made once a frame.
struct GainCurves {
    static constexpr uint32_t kMaxExceptions = 4;

    // The tables must outlive the curves.
    explicit GainCurves(const ColorTables& from);

    const ColorTables* tables;

    // True when the rest gives every entry i of the tables as
    //   min(whole * i + ((fraction * i) >> 16), 255), less 1 if i is one of the exceptions.
    // The exceptions come from gains just below a fraction, where the product with some i was
    // rounded up to a whole number and with others was not.
    bool exact;
    uint32_t exceptionCount;

    // A word for each byte of a pixel; alpha stays what it is.
    uint16_t whole[4];
    uint16_t fraction[4];
    uint16_t exception[kMaxExceptions][4]; // 0xFFFF where a channel has fewer
};

// count pixels of B, G, R, A. Each channel goes through the first and then the second tables;
// pixels of luma 200 and above are blended back towards their input by up to 35 / 55. Alpha is
// copied. dst may be src itself but must not overlap it otherwise.
using ColorTemperatureRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                                     const GainCurves& first, const GainCurves& second);

KYV_FORMS(ColorTemperatureRow, ColorTemperatureRow)

extern const KernelTable<ColorTemperatureRow> kColorTemperatureRow;

} // namespace kyv
