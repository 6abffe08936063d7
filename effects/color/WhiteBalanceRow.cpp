// White balance of a row: the definition, the lines of its tables, and the table of forms.
#include "effects/color/WhiteBalanceRow.h"

#include <algorithm>

#include "effects/color/LineFit.h"

namespace kyv {
namespace {

// The line of the entries first .. last of a table above the entry at first. False when they are
// not a line, or one so steep that the product with a byte leaves a signed word.
bool FitPart(const uint32_t* table, uint32_t first, uint32_t last, uint32_t& multiplier) {
    multiplier = 0;
    if (first == last) {
        return true;
    }
    const uint32_t base = table[first];
    if (*std::min_element(table + first, table + last + 1) < base) {
        return false;
    }
    const LineFit fit = FitLine([&](uint32_t i) { return table[first + i] - base; }, last - first);
    multiplier = fit.low;
    return fit.low <= fit.high && (fit.low >> 16) * (last - first) <= 255;
}

} // namespace

KneeCurves::KneeCurves(const KneeTable& blue, const KneeTable& green, const KneeTable& red)
    : table{blue.entries, green.entries, red.entries}, exact(true) {
    const KneeTable* tables[] = {&blue, &green, &red};
    for (int channel = 0; channel < 3; ++channel) {
        const uint32_t* entries = table[channel];
        uint32_t at = 255;
        uint32_t rise = 0;
        uint32_t beyond = 0;
        if (!FitPart(entries, 0, 255, rise)) {
            at = std::min(tables[channel]->knee, 255U);
            exact = exact && FitPart(entries, 0, at, rise) && FitPart(entries, at, 255, beyond) &&
                    beyond <= 0xFFFF;
        }
        knee[channel] = static_cast<uint8_t>(at);
        base[channel] = static_cast<uint8_t>(entries[0]);
        whole[channel] = static_cast<uint16_t>(rise >> 16);
        fraction[channel] = static_cast<uint16_t>(rise);
        slope[channel] = static_cast<uint16_t>(beyond);
    }
    knee[3] = 255;
    base[3] = 0;
    whole[3] = 1;
    fraction[3] = 0;
    slope[3] = 0;
}

void WhiteBalanceRow_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                            const KneeCurves& curves) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        for (int channel = 0; channel < 3; ++channel) {
            dst[channel] = static_cast<uint8_t>(curves.table[channel][src[channel]]);
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<WhiteBalanceRow> kWhiteBalanceRow = {KYV_TABLE(WhiteBalanceRow),
                                                                 .passedOver = kNoneIsPassedOver};

} // namespace kyv
