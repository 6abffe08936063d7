// Lookup tables recognised as straight lines, which vector code computes faster than it looks up.
#pragma once

#include <cstdint>

namespace kyv {

// The multipliers m for which (m * i) >> 16 is entry i of a table, for all i: those within
// low..high, if low <= high. Otherwise no line gives the table, and low is the smallest multiplier
// that lets no entry fall short.
//
// The entries of a line whose slope is any real number are always found: two different fractions
// with denominators up to 255 lie further apart than 1 / 65536, so that a multiple of that falls
// between them.
struct LineFit {
    uint32_t low = 0;
    uint32_t high = 0;
};

// entry(i) gives the entries for 0 <= i <= last, where last is 1..255: 0 for i = 0, otherwise 0 to
// 255. An entry of 255 stands for any value from there on.
template <class Entry>
LineFit FitLine(Entry&& entry, uint32_t last) {
    // The steepest entry / i and the flattest (entry + 1) / i, as fractions.
    uint32_t lowTop = 0, lowBottom = 1;
    uint32_t highTop = 256, highBottom = 1;
    for (uint32_t i = 1; i <= last; ++i) {
        const uint32_t value = entry(i);
        if (value * lowBottom > lowTop * i) {
            lowTop = value;
            lowBottom = i;
        }
        if (value < 255 && (value + 1) * highBottom < highTop * i) {
            highTop = value + 1;
            highBottom = i;
        }
    }
    return {((lowTop << 16) + lowBottom - 1) / lowBottom, ((highTop << 16) - 1) / highBottom};
}

} // namespace kyv
