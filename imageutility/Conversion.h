// Conversion of single colours; the images' conversions are members of their classes.
//
// BT.601 studio range in units of 1/4096, sums in 32 bits, arithmetic shift by 12.
#pragma once

#include <cstdint>

namespace KYVImageUtility {

// The luma of an 8-bit colour, 16 (black) to 235 (white).
void RgbToLuma(uint8_t r, uint8_t g, uint8_t b, uint8_t* luma);

// For 8-bit inputs Y is 16..235, U and V are 16..240.
void RgbToYuv(uint32_t r, uint32_t g, uint32_t b, uint32_t* y, uint32_t* u, uint32_t* v);

// Not clamped: results below 0 or above 255 are stored as they are, in two's complement.
void YuvToRgb(uint32_t y, uint32_t u, uint32_t v, uint32_t* r, uint32_t* g, uint32_t* b);

} // namespace KYVImageUtility
