// Colour temperature of a row: the definition, the gains of its tables, and the table of forms.
#include "effects/color/ColorTemperatureRow.h"

#include <algorithm>
#include <cstring>

#include "effects/color/LineFit.h"
#include "imageutility/kernels/ColorMath.h"

namespace kyv {
namespace {

constexpr int32_t kHighlightLuma = 200;
constexpr uint32_t kHighlightSpan = 255 - kHighlightLuma;

// The vector forms keep a product with a gain in a signed word: 127 * 255 + 254 fits.
constexpr uint32_t kMaxMultiplier = 128 << 16;

} // namespace

GainCurves::GainCurves(const ColorTables& from) : tables(&from), exact(true), exceptionCount(0) {
    std::memset(exception, 0xFF, sizeof exception);
    for (int channel = 0; channel < 3; ++channel) {
        const uint32_t* table = from.channel[channel];
        const LineFit fit = FitLine([table](uint32_t i) { return table[i]; }, 255);
        whole[channel] = static_cast<uint16_t>(fit.low >> 16);
        fraction[channel] = static_cast<uint16_t>(fit.low);
        exact = exact && table[0] == 0 && fit.low < kMaxMultiplier;
        if (fit.low <= fit.high) {
            continue;
        }
        uint32_t count = 0;
        for (uint32_t i = 1; i < 256 && exact; ++i) {
            const uint32_t excess = std::min((fit.low * i) >> 16, 255U) - table[i];
            if (excess == 0) {
                continue;
            }
            exact = excess == 1 && count < kMaxExceptions;
            if (exact) {
                exception[count++][channel] = static_cast<uint16_t>(i);
            }
        }
        exceptionCount = std::max(exceptionCount, count);
    }
    whole[3] = 1;
    fraction[3] = 0;
}

void ColorTemperatureRow_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                                const GainCurves& first, const GainCurves& second) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const int32_t luma = LumaOf(src[2], src[1], src[0]);
        // Both weights sum to the span: highlights keep part of their input in either stage.
        const bool highlight = luma >= kHighlightLuma;
        const auto corrected = highlight ? static_cast<uint32_t>(255 - luma) : kHighlightSpan;
        const uint32_t kept = kHighlightSpan - corrected;
        for (int channel = 0; channel < 3; ++channel) {
            const uint32_t c = src[channel];
            const uint32_t t1 = first.tables->channel[channel][c];
            const uint32_t c1 = std::min((t1 * corrected + c * kept) / kHighlightSpan, 255U);
            const uint32_t t2 = second.tables->channel[channel][c1];
            dst[channel] = static_cast<uint8_t>((t2 * corrected + c1 * kept) / kHighlightSpan);
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<ColorTemperatureRow> kColorTemperatureRow = {
    KYV_TABLE(ColorTemperatureRow), .passedOver = kNoneIsPassedOver};

} // namespace kyv
