// Hue, saturation and lightness planes.
//
// All three use a full scale of 65532, which divides by 6, and are stored as their high bytes.
#include "imageutility/ImageUtility.h"

#include <algorithm>

namespace KYVImageUtility {
namespace {

constexpr int32_t kFull = 65532;
constexpr int32_t kSixth = kFull / 6;
constexpr int32_t kThird = kFull / 3;
constexpr int32_t kHalf = kFull / 2;
constexpr int32_t kTwoThirds = 2 * kThird; // also the hue that stands for "none"

struct HslTriple {
    int32_t h;
    int32_t s;
    int32_t l;
};

constexpr int32_t WrapFull(int32_t value) {
    return value < 0 ? value + kFull : value > kFull ? value - kFull : value;
}

HslTriple HslOf(int32_t r, int32_t g, int32_t b) {
    const int32_t max = std::max({r, g, b});
    const int32_t min = std::min({r, g, b});
    const int32_t d = max - min;
    const int32_t sum = max + min;
    HslTriple hsl = {kTwoThirds, 0, (sum * kFull + 255) / 510};
    if (d == 0) {
        return hsl;
    }
    const int32_t divisor = hsl.l <= kHalf ? sum : 510 - sum;
    hsl.s = (d * kFull + divisor / 2) / divisor;
    // The rounding term is added before a division that truncates, for negative hues too. Ties in
    // the maximum go to red, then green.
    if (r == max) {
        hsl.h = ((g - b) * kSixth + d / 2) / d;
    } else if (g == max) {
        hsl.h = ((b - r) * kSixth + d / 2) / d + kThird;
    } else {
        hsl.h = ((r - g) * kSixth + d / 2) / d + kTwoThirds;
    }
    hsl.h = WrapFull(hsl.h);
    return hsl;
}

uint8_t ChannelOf(int32_t m1, int32_t m2, int32_t hue) {
    hue = WrapFull(hue);
    int32_t value = m1;
    if (hue < kSixth) {
        value = m1 + ((m2 - m1) * hue + kSixth / 2) / kSixth;
    } else if (hue < kHalf) {
        value = m2;
    } else if (hue < kTwoThirds) {
        value = m1 + ((m2 - m1) * (kTwoThirds - hue) + kSixth / 2) / kSixth;
    }
    return static_cast<uint8_t>((value * 255 + kHalf) / kFull);
}

// Sets B, G and R of a pixel from the bytes of the three planes.
void SetRgb(uint8_t* pixel, uint8_t hue, uint8_t saturation, uint8_t lightness) {
    const int32_t h = hue * 256;
    const int32_t s = saturation * 256;
    const int32_t l = lightness * 256;
    if (s == 0) {
        pixel[0] = pixel[1] = pixel[2] = static_cast<uint8_t>(l * 255 / kFull);
        return;
    }
    // l * s is just below 2^32 and wants 64 bits.
    const int64_t product = int64_t{l} * (l <= kHalf ? kFull + s : s);
    const auto quotient = static_cast<int32_t>((product + kHalf) / kFull);
    int32_t m2 = l <= kHalf ? quotient : l + s - quotient;
    int32_t m1 = 2 * l - m2;
    m1 = WrapFull(m1);
    m2 = WrapFull(m2);
    pixel[2] = ChannelOf(m1, m2, h + kThird);
    pixel[1] = ChannelOf(m1, m2, h);
    pixel[0] = ChannelOf(m1, m2, h - kThird);
}

bool FitPlanes(const CImageARGB& image, const CImageByte& hue, const CImageByte& saturation,
               const CImageByte& lightness) {
    return image.GetBuffer() && hue.GetBuffer() && saturation.GetBuffer() &&
           lightness.GetBuffer() && image.IsSameSize(hue) && image.IsSameSize(saturation) &&
           image.IsSameSize(lightness);
}

} // namespace

void CImageARGB::ToHSL(CImageByte& hue, CImageByte& saturation, CImageByte& lightness) const {
    if (!FitPlanes(*this, hue, saturation, lightness)) {
        return;
    }
    for (int32_t y = 0; y < GetHeight(); ++y) {
        const uint8_t* pixel = Row(y);
        for (int32_t x = 0; x < GetWidth(); ++x, pixel += 4) {
            const HslTriple hsl = HslOf(pixel[2], pixel[1], pixel[0]);
            hue.Row(y)[x] = static_cast<uint8_t>(hsl.h >> 8);
            saturation.Row(y)[x] = static_cast<uint8_t>(hsl.s >> 8);
            lightness.Row(y)[x] = static_cast<uint8_t>(hsl.l >> 8);
        }
    }
}

void CImageARGB::FromHSL(const CImageByte& hue, const CImageByte& saturation,
                         const CImageByte& lightness) {
    if (!FitPlanes(*this, hue, saturation, lightness)) {
        return;
    }
    for (int32_t y = 0; y < GetHeight(); ++y) {
        uint8_t* pixel = Row(y);
        for (int32_t x = 0; x < GetWidth(); ++x, pixel += 4) {
            SetRgb(pixel, hue.Row(y)[x], saturation.Row(y)[x], lightness.Row(y)[x]);
        }
    }
}

} // namespace KYVImageUtility
