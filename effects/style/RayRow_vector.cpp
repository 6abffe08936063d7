// Smearing and adding light.
#include "effects/style/RayRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

inline Vec Between(Vec a, Vec b, Vec fraction) {
    const Vec rest = Xor(fraction, Splat16(65535));
    return Add16(MulHighU16(a, rest), MulHighU16(b, fraction));
}

} // namespace

void RayShadeRow(uint16_t* dst, const uint8_t* src, const uint16_t* shadows, size_t count) {
    size_t i = 0;
    for (; i + kLongs <= count; i += kLongs) {
        const Vec pixels = LoadBytes16(src + i * 4);
        const Vec light = Or(pixels, ShiftLeft16<8>(pixels));
        Store(dst + i * 4, MulHighU16(light, LoadWords64(shadows + i)));
    }
    RayShadeRow_scalar(dst + i * 4, src + i * 4, shadows + i, count - i);
}

void RayLerpRow(uint16_t* dst, const uint16_t* upper, const uint16_t* lower, size_t count,
                uint16_t fraction) {
    const Vec way = Splat16(fraction);
    size_t i = 0;
    for (; i + kWords <= count; i += kWords) {
        Store(dst + i, Between(Load(upper + i), Load(lower + i), way));
    }
    RayLerpRow_scalar(dst + i, upper + i, lower + i, count - i, fraction);
}

void RayStepRow(uint16_t* dst, const uint16_t* src, const uint16_t* row, size_t count,
                const RayColumns& columns, const RayShares& shares) {
    const Vec kept = Splat16(shares.kept);
    const Vec brought = Splat16(shares.brought);
    size_t i = 0;
    for (; i + kLongs <= count; i += kLongs) {
        // A pixel and its right neighbour fill a block; a block of the result has two pixels.
        const auto pair = [&](size_t pixel) {
            return LoadBlock(row + size_t{4} * static_cast<uint32_t>(columns.left[i + pixel]));
        };
        const Vec even = FromBlocks([&](size_t block) { return pair(2 * block); });
        const Vec odd = FromBlocks([&](size_t block) { return pair(2 * block + 1); });
        const Vec moved = Between(InterleaveLow64(even, odd), InterleaveHigh64(even, odd),
                                  LoadWords64(columns.fractions + i));
        Store(dst + i * 4, Add16(MulHighU16(Load(src + i * 4), kept), MulHighU16(moved, brought)));
    }
    RayStepRow_scalar(dst + i * 4, src + i * 4, row, count - i,
                      {columns.left + i, columns.fractions + i}, shares);
}

void RayAddRow(uint8_t* dst, const uint8_t* src, const uint8_t* light, size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec pixels = Load(src + i * 4);
        const Words spread = Spread(Strongest(pixels));
        const Vec all = PackU16(spread.low, spread.high);
        const Words room = Widen(Xor(AverageU8(pixels, all), Splat8(255)));
        const Words taken = Widen(AddSatU8(AddSatU8(all, all), Splat8(kBlackTakes)));
        const Words add = Widen(Load(light + i * 4));
        const Vec low = Product(Product(add.low, taken.low), room.low);
        const Vec high = Product(Product(add.high, taken.high), room.high);
        const Vec sum = AddSatU8(pixels, PackU16(low, high));
        Store(dst + i * 4, WithAlphaOf(pixels, sum));
    }
    RayAddRow_scalar(dst + i * 4, src + i * 4, light + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
