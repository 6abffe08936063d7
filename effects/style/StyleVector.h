// The rules of StyleMath.h for vectors of words, and the way between pixels and their words.
#pragma once

#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Pixels of B, G, R, A as words: of each block the first two and the last two.
struct Words {
    Vec low;
    Vec high;
};

inline Words Widen(Vec pixels) {
    return {WidenLow8(pixels), WidenHigh8(pixels)};
}

// One value a pixel, in doublewords below 65536, for every channel of the pixel.
inline Words Spread(Vec values) {
    const Vec twice = TwiceLow16(values);
    return {DoubleLow32(twice), DoubleHigh32(twice)};
}

// StyleLuma of kPixels pixels, in doublewords.
inline Vec Luma(Words pixels) {
    const Vec weights = PixelWords(29, 150, 77, 0);
    const Vec sums =
        AddNeighbours32(MulAddPairs16(pixels.low, weights), MulAddPairs16(pixels.high, weights));
    return ShiftRight32<8>(Add32(sums, Splat32(128)));
}

// The strongest of each pixel's B, G and R, in doublewords.
inline Vec Strongest(Vec pixels) {
    return And(MaxU8(MaxU8(pixels, ShiftRight32<8>(pixels)), ShiftRight32<16>(pixels)),
               Splat32(255));
}

inline Vec Mix(Vec a, Vec b, Vec weight) {
    const Vec sum = Add16(MulLow16(a, Sub16(Splat16(256), weight)), MulLow16(b, weight));
    return ShiftRight16<8>(Add16(sum, Splat16(128)));
}

inline Vec Product(Vec a, Vec b) {
    const Vec t = Add16(MulLow16(a, b), Splat16(128));
    return ShiftRight16<8>(Add16(t, ShiftRight16<8>(t)));
}

// (a * weight + 128) >> 8 for values of 0..255 and weights of 0..256.
inline Vec Scale(Vec a, Vec weight) {
    return ShiftRight16<8>(Add16(MulLow16(a, weight), Splat16(128)));
}

inline Vec Invert(Vec value) {
    return Xor(value, Splat16(255));
}

// The alpha of one and the colours of the other.
inline Vec WithAlphaOf(Vec alpha, Vec colors) {
    const Vec mask = Splat32(0xFF000000);
    return Or(And(mask, alpha), ClearBits(colors, mask));
}

} // namespace
} // namespace kyv::KYV_VECTOR_SET
