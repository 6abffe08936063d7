// The pixel loop of the white balance.
#pragma once

#include <cstddef>
#include <cstdint>

#include "imageutility/kernels/KernelTable.h"

namespace kyv {

// A table of 256 entries, each 0 to 255, that is one line, or a line up to an input value and a
// flatter one from there on.
struct KneeTable {
    const uint32_t* entries;
    uint32_t knee;
};

// Tables together with the lines that they were made of. Made once a frame.
struct KneeCurves {
    // The entries must outlive the curves. A knee that is not one costs speed alone.
    KneeCurves(const KneeTable& blue, const KneeTable& green, const KneeTable& red);

    const uint32_t* table[3]; // in the order of a pixel's bytes

    // True when the rest gives every entry of the tables: with i up to the knee
    //   base + whole * i + ((fraction * i) >> 16)
    // and further on the value at the knee + ((slope * (i - knee)) >> 16).
    bool exact;

    // For each byte of a pixel; alpha stays what it is.
    uint8_t knee[4];
    uint8_t base[4];
    uint16_t whole[4];
    uint16_t fraction[4];
    uint16_t slope[4];
};

// count pixels of B, G, R, A, each channel through its table. Alpha is copied. dst may be src
// itself but must not overlap it otherwise.
using WhiteBalanceRow = void (*)(uint8_t* dst, const uint8_t* src, size_t count,
                                 const KneeCurves& curves);

KYV_FORMS(WhiteBalanceRow, WhiteBalanceRow)

extern const KernelTable<WhiteBalanceRow> kWhiteBalanceRow;

} // namespace kyv
