// Colour temperature of a row: the definition and the table of forms.
#include "effects/color/ColorTemperatureRow.h"

#include <algorithm>

#include "imageutility/kernels/ColorMath.h"

namespace kyv {
namespace {

constexpr int32_t kHighlightLuma = 200;
constexpr uint32_t kHighlightSpan = 255 - kHighlightLuma;

} // namespace

void ColorTemperatureRow_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                                const ColorTables& first, const ColorTables& second) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const int32_t luma = LumaOf(src[2], src[1], src[0]);
        // Both weights sum to the span: highlights keep part of their input in either stage.
        const bool highlight = luma >= kHighlightLuma;
        const auto corrected = highlight ? static_cast<uint32_t>(255 - luma) : kHighlightSpan;
        const uint32_t kept = kHighlightSpan - corrected;
        for (int channel = 0; channel < 3; ++channel) {
            const uint32_t c = src[channel];
            const uint32_t c1 =
                std::min((first.channel[channel][c] * corrected + c * kept) / kHighlightSpan, 255U);
            dst[channel] = static_cast<uint8_t>(
                (second.channel[channel][c1] * corrected + c1 * kept) / kHighlightSpan);
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<ColorTemperatureRow> kColorTemperatureRow = {
    .scalar = ColorTemperatureRow_scalar,
};

} // namespace kyv
