// The weights of the four-tap resizing.
#pragma once

#include <array>
#include <cstdint>

namespace KYVImageUtility {

// Positions are kept in 1/32 of a pixel, and weights in 1/2048: a 4 x 4 sum of bytes, at most
// 255 * 2048^2 * 1.25^2 in size, then fits in 32 bits.
inline constexpr int32_t kCubicPhases = 32;
inline constexpr int32_t kCubicShift = 11;
inline constexpr int32_t kCubicOne = 1 << kCubicShift;

using CubicTaps = std::array<int32_t, 4>;

// The cubic through the four samples whose slope at a sample is half the difference of its
// neighbours (the cardinal spline of tension 0.5): it passes through the samples, is exact for
// straight lines and hardly rings.
constexpr std::array<CubicTaps, kCubicPhases> MakeCubicWeights() {
    std::array<CubicTaps, kCubicPhases> table = {};
    for (int32_t t = 0; t < kCubicPhases; ++t) {
        // With t in 1/32 the polynomials, in units of 1/65536, are whole numbers.
        const int32_t t1 = t * 32 * 32;
        const int32_t t2 = t * t * 32;
        const int32_t t3 = t * t * t;
        const CubicTaps exact = {-t1 + 2 * t2 - t3, 65536 - 5 * t2 + 3 * t3, t1 + 4 * t2 - 3 * t3,
                                 t3 - t2};
        CubicTaps& taps = table[static_cast<size_t>(t)];
        int32_t sum = 0;
        for (size_t i = 0; i < 4; ++i) {
            taps[i] = (exact[i] + 16) >> 5;
            sum += taps[i];
        }
        // What rounding left goes to the larger of the middle taps: flat areas stay exact.
        taps[t <= kCubicPhases / 2 ? 1 : 2] += kCubicOne - sum;
    }
    return table;
}

inline constexpr std::array<CubicTaps, kCubicPhases> kCubicWeights = MakeCubicWeights();

} // namespace KYVImageUtility
