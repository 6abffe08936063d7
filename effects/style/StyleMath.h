// Small fixed-point rules that the scalar kernels of the style effects share.
#pragma once

#include <algorithm>
#include <cstdint>

namespace kyv {

// The luma of full-range B, G, R, 0..255, rounded. The weights sum to 256.
constexpr uint32_t StyleLuma(uint32_t b, uint32_t g, uint32_t r) {
    return (29 * b + 150 * g + 77 * r + 128) >> 8;
}

// How much a pixel shines: the rounded mean of its luma and its strongest channel, so that coloured
// lights count too.
constexpr uint32_t StyleBrightness(uint32_t b, uint32_t g, uint32_t r) {
    return (StyleLuma(b, g, r) + std::max({b, g, r}) + 1) >> 1;
}

// a and b mixed by a weight of 0..256, rounded; all of it fits 16 bits.
constexpr uint32_t StyleMix(uint32_t a, uint32_t b, uint32_t weight) {
    return (a * (256 - weight) + b * weight + 128) >> 8;
}

// a * b / 255, rounded, for values of 0..255.
constexpr uint32_t StyleProduct(uint32_t a, uint32_t b) {
    const uint32_t t = a * b + 128;
    return (t + (t >> 8)) >> 8;
}

// The nearest integer of a value that is not negative; halves go up.
constexpr int32_t RoundHalfUp(float value) {
    const float raised = value + 0.5F;
    return static_cast<int32_t>(raised);
}

} // namespace kyv
