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

// Sums wrap around, so that values far outside 8 bits have a result too.
constexpr int32_t FromFixed(uint32_t sum) {
    return static_cast<int32_t>(sum) >> 12;
}

// 0x10800 is 16.5 x 4096: the studio offset and one half for rounding. White gives 235.
constexpr int32_t LumaOf(uint32_t r, uint32_t g, uint32_t b) {
    return FromFixed(1053 * r + 2064 * g + 401 * b + 0x10800);
}

// 0x80800 is 128.5 x 4096: the chroma centre and one half. 8-bit inputs need no clamping: Y stays
// within 16..235, U and V within 16..240.
constexpr YuvTriple YuvOf(uint32_t r, uint32_t g, uint32_t b) {
    return {LumaOf(r, g, b), FromFixed(0x80800 - 606 * r - 1192 * g + 1798 * b),
            FromFixed(0x80800 + 1798 * r - 1507 * g - 291 * b)};
}

// Not clamped.
constexpr RgbTriple RgbOf(uint32_t y, uint32_t u, uint32_t v) {
    const uint32_t luma = (y - 16) * 4768 + 2048;
    const uint32_t cb = u - 128;
    const uint32_t cr = v - 128;
    return {FromFixed(luma + 6537 * cr), FromFixed(luma - 1602 * cb - 3330 * cr),
            FromFixed(luma + 8266 * cb)};
}

constexpr uint8_t ClampByte(int32_t value) {
    return static_cast<uint8_t>(value < 0 ? 0 : value > 255 ? 255 : value);
}

} // namespace kyv
