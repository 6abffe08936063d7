// Adjusting the pixels of one image, each by itself.
#include <algorithm>
#include <array>

#include "imageutility/ImageUtility.h"
#include "imageutility/RowWalk.h"
#include "imageutility/kernels/ColorMath.h"
#include "imageutility/kernels/Contrast.h"

namespace KYVImageUtility {
namespace {

constexpr int32_t kOne = 4096; // 1.0 in the fixed point of the adjustments

int32_t Fixed(float value) {
    return static_cast<int32_t>(value * static_cast<float>(kOne));
}

} // namespace

void CImageARGB::Contrast(float factor) {
    // Written so that a NaN fails.
    if (!(factor >= 0.0F && factor <= 2.0F)) {
        return;
    }
    WalkRows(FormFor(kyv::kContrast, *this), *this, Fixed(factor));
}

void CImageARGB::AdjustLightness(float amount) {
    if (!(amount >= -1.0F && amount <= 1.0F)) {
        return;
    }
    const int32_t k = Fixed(amount);
    std::array<uint8_t, 256> table;
    for (int32_t i = 0; i < 256; ++i) {
        const int32_t room = k > 0 ? 255 - i : i;
        table[i] = static_cast<uint8_t>(i + ((room * k + kOne / 2) >> 12));
    }
    const auto adjust = [&table](uint8_t* pixels, size_t count) {
        for (size_t i = 0; i < count; ++i, pixels += 4) {
            pixels[0] = table[pixels[0]];
            pixels[1] = table[pixels[1]];
            pixels[2] = table[pixels[2]];
        }
    };
    WalkRows(adjust, *this);
}

void CImageARGB::AdjustSaturation(int32_t percent) {
    if (percent < 0 || percent > 200) {
        return;
    }
    const int32_t k = (percent * kOne + 50) / 100;
    const auto adjust = [k](uint8_t* pixels, size_t count) {
        for (size_t i = 0; i < count; ++i, pixels += 4) {
            // Full range, so that greys stay as they are; the weights sum to 4096.
            const int32_t gray =
                (467 * pixels[0] + 2404 * pixels[1] + 1225 * pixels[2] + kOne / 2) >> 12;
            for (int c = 0; c < 3; ++c) {
                pixels[c] = kyv::ClampByte(gray + (((pixels[c] - gray) * k + kOne / 2) >> 12));
            }
        }
    };
    WalkRows(adjust, *this);
}

void CImageARGB::SubtractGray(const CImageBase& gray) {
    const int32_t step = gray.GetBytesPerPixel();
    const auto subtract = [step](uint8_t* pixels, const uint8_t* from, size_t count) {
        for (size_t i = 0; i < count; ++i, pixels += 4, from += step) {
            const uint8_t g = *from;
            for (int c = 0; c < 3; ++c) {
                pixels[c] = static_cast<uint8_t>(pixels[c] - std::min(pixels[c], g));
            }
        }
    };
    WalkRowPairs(subtract, *this, gray);
}

void CImageAYUV::TintAYUV(uint8_t r, uint8_t g, uint8_t b, uint8_t a) {
    const auto tint = [r, g, b, a](uint8_t* pixels, size_t count) {
        for (size_t i = 0; i < count; ++i, pixels += 4) {
            if (pixels[3] == 0) {
                continue;
            }
            // Nothing is clamped on the way; what leaves 0..255 keeps its low byte. Intended.
            const kyv::RgbTriple rgb = kyv::RgbOf(pixels[2], pixels[1], pixels[0]);
            const kyv::YuvTriple yuv =
                kyv::YuvOf((rgb.r * r) >> 8, (rgb.g * g) >> 8, (rgb.b * b) >> 8);
            pixels[0] = static_cast<uint8_t>(yuv.v);
            pixels[1] = static_cast<uint8_t>(yuv.u);
            pixels[2] = static_cast<uint8_t>(yuv.y);
            pixels[3] = static_cast<uint8_t>((pixels[3] * a) >> 8);
        }
    };
    WalkRows(tint, *this);
}

} // namespace KYVImageUtility
