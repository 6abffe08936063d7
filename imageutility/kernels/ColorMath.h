// The integer arithmetic of BT.601 studio range, written once for all scalar code.
//
// Coefficients are in units of 1/4096; sums are formed in 32 bits and shifted by 12.
#pragma once

#include <cstdint>

namespace kyv {

struct YuvTriple {
    int32_t y;
    int32_t u;
    int32_t v;
};

struct RgbTriple {
    int32_t r;
    int32_t g;
    int32_t b;
};

// 0x10800 is 16.5 x 4096: the studio offset and one half for rounding. White gives 235.
constexpr int32_t LumaOf(int32_t r, int32_t g, int32_t b) {
    return (1053 * r + 2064 * g + 401 * b + 0x10800) >> 12;
}

// 0x80800 is 128.5 x 4096: the chroma centre and one half. 8-bit inputs need no clamping: Y stays
// within 16..235, U and V within 16..240.
constexpr YuvTriple YuvOf(int32_t r, int32_t g, int32_t b) {
    return {LumaOf(r, g, b), (-606 * r - 1192 * g + 1798 * b + 0x80800) >> 12,
            (1798 * r - 1507 * g - 291 * b + 0x80800) >> 12};
}

// Not clamped.
constexpr RgbTriple RgbOf(int32_t y, int32_t u, int32_t v) {
    const int32_t luma = (y - 16) * 4768 + 2048;
    const int32_t cb = u - 128;
    const int32_t cr = v - 128;
    return {(luma + 6537 * cr) >> 12, (luma - 1602 * cb - 3330 * cr) >> 12,
            (luma + 8266 * cb) >> 12};
}

constexpr uint8_t ClampByte(int32_t value) {
    return static_cast<uint8_t>(value < 0 ? 0 : value > 255 ? 255 : value);
}

} // namespace kyv
