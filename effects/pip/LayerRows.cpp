// Layer passes: the definitions and the tables of forms.
#include "effects/pip/LayerRows.h"

#include <cstdlib>

namespace kyv {
namespace {

uint32_t Mismatch(const uint8_t* pixel, uint32_t key, int32_t tolerance) {
    for (int c = 0; c < 3; ++c) {
        if (std::abs(pixel[c] - static_cast<int32_t>(key >> (8 * c) & 255)) > tolerance) {
            return 1;
        }
    }
    return 0;
}

} // namespace

void ColorKeyRow_scalar(uint8_t* pixels, const uint8_t* below, size_t count, uint32_t key,
                        uint8_t tolerance) {
    for (size_t i = 0; i < count; ++i) {
        const size_t here = i * 4;
        const size_t right = i + 1 < count ? here + 4 : here;
        if (pixels[here + 3] == 0) {
            continue;
        }
        const uint32_t sum =
            64 *
            (Mismatch(pixels + here, key, tolerance) + Mismatch(pixels + right, key, tolerance) +
             Mismatch(below + here, key, tolerance) + Mismatch(below + right, key, tolerance));
        pixels[here + 3] = static_cast<uint8_t>(sum > 255 ? 255 : sum);
    }
}

void GradientRow_scalar(uint8_t* pixels, const float* top, const float* rise, size_t count,
                        float part) {
    for (size_t i = 0; i < count * 4; i += 4) {
        if (pixels[i + 3] == 0) {
            continue;
        }
        for (size_t c = i; c < i + 3; ++c) {
            const float value = top[c] + rise[c] * part;
            pixels[c] =
                static_cast<uint8_t>(value < 255.0F ? (value > 0.0F ? value : 0.0F) : 255.0F);
        }
    }
}

constinit const KernelTable<ColorKeyRow> kColorKeyRow = {KYV_TABLE(ColorKeyRow)};

constinit const KernelTable<GradientRow> kGradientRow = {KYV_TABLE(GradientRow)};

} // namespace kyv
