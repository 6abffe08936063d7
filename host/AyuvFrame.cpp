// AYUV frames: the plain definition in 16-bit fixed point.
#include "host/AyuvFrame.h"

#include <algorithm>

namespace kyvhost {
namespace {

constexpr int32_t Fixed(double factor) {
    return static_cast<int32_t>(factor * 65536 + (factor < 0 ? -0.5 : 0.5));
}

constexpr double kRed = 0.299, kGreen = 0.587, kBlue = 0.114; // the weights of luma
constexpr double kLumaSpan = 219.0 / 255;
constexpr double kBlueSpan = 224.0 / 255 / (2 * (1 - kBlue)); // of U, along B - Y
constexpr double kRedSpan = 224.0 / 255 / (2 * (1 - kRed));   // of V, along R - Y
constexpr int32_t kHalf = 1 << 15;

uint8_t Clamped(int32_t value) {
    return static_cast<uint8_t>(std::clamp(value, 0, 255));
}

} // namespace

void BgraToAyuv(uint8_t* frame, size_t pixels) {
    for (uint8_t* p = frame; p != frame + pixels * 4; p += 4) {
        const int32_t b = p[0], g = p[1], r = p[2];
        const int32_t y = Fixed(kRed * kLumaSpan) * r + Fixed(kGreen * kLumaSpan) * g +
                          Fixed(kBlue * kLumaSpan) * b;
        const int32_t u = Fixed(-kRed * kBlueSpan) * r + Fixed(-kGreen * kBlueSpan) * g +
                          Fixed((1 - kBlue) * kBlueSpan) * b;
        const int32_t v = Fixed((1 - kRed) * kRedSpan) * r + Fixed(-kGreen * kRedSpan) * g +
                          Fixed(-kBlue * kRedSpan) * b;
        p[0] = static_cast<uint8_t>((v + kHalf + (128 << 16)) >> 16);
        p[1] = static_cast<uint8_t>((u + kHalf + (128 << 16)) >> 16);
        p[2] = static_cast<uint8_t>((y + kHalf + (16 << 16)) >> 16);
    }
}

void AyuvToBgra(uint8_t* frame, size_t pixels) {
    for (uint8_t* p = frame; p != frame + pixels * 4; p += 4) {
        const int32_t v = p[0] - 128, u = p[1] - 128;
        const int32_t y = (p[2] - 16) * Fixed(1 / kLumaSpan) + kHalf;
        const int32_t blue = Fixed(1 / kBlueSpan) * u;
        const int32_t red = Fixed(1 / kRedSpan) * v;
        const int32_t green =
            Fixed(-kBlue / kGreen / kBlueSpan) * u + Fixed(-kRed / kGreen / kRedSpan) * v;
        p[0] = Clamped((y + blue) >> 16);
        p[1] = Clamped((y + green) >> 16);
        p[2] = Clamped((y + red) >> 16);
    }
}

} // namespace kyvhost
