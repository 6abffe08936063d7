// Bilinear resizing. Where bytes can be multiplied and added in pairs, the two weights of a pixel
// meet its two neighbours in one instruction; elsewhere their difference is multiplied.
#include "imageutility/kernels/Bilinear.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Two pixels a block less 128, 16 bits a channel, from their neighbours' interleaved bytes. The
// weights go up to 128, which only the unsigned operand holds, so the pixels are the signed one.
inline Vec Interpolate(Vec neighbours, Vec weights) {
    return ShiftRightS16<7>(MulAddBytes(weights, Xor(neighbours, Splat8(0x80))));
}

// a + (((b - a) * f) >> 7) in 16 bits.
inline Vec Between(Vec a, Vec b, Vec fractions) {
    return Add16(a, ShiftRightS16<7>(MulLow16(Sub16(b, a), fractions)));
}

// kPixels pixels from two functions that give the neighbours of pixels 0 and 1 of every four, and
// of pixels 2 and 3.
template <class GetFirst, class GetSecond>
inline void DrawPixels(uint8_t* dst, const uint8_t* weights, GetFirst first, GetSecond second) {
    // The weights of four pixels, twice in a block; then those of a pixel once a channel.
    const Vec w = DoubleEach64(LoadHalf(weights));
    const Vec low = ShuffleBytes(w, RepeatBytes({0, 1, 0, 1, 0, 1, 0, 1, 2, 3, 2, 3, 2, 3, 2, 3}));
    const Vec high = ShuffleBytes(w, RepeatBytes({4, 5, 4, 5, 4, 5, 4, 5, 6, 7, 6, 7, 6, 7, 6, 7}));
    const Vec bytes = PackS16(Interpolate(first(), low), Interpolate(second(), high));
    Store(dst, Xor(bytes, Splat8(0x80)));
}

// The pixels that have a shuffle for every two.
[[maybe_unused]] inline size_t DrawShuffled(uint8_t* dst, const uint8_t* src,
                                            const BilinearColumns& columns) {
    size_t i = 0;
    for (; i + kPixels <= columns.shuffled; i += kPixels) {
        const auto two = [&](size_t from) {
            const Vec four = FromBlocks([&](size_t k) {
                return LoadBlock(src + static_cast<ptrdiff_t>(columns.left[from + 4 * k]) * 4);
            });
            return ShuffleBytes(four, FromBlocks([&](size_t k) {
                                    return LoadBlock(columns.shuffles + 8 * (from + 4 * k));
                                }));
        };
        DrawPixels(
            dst + i * 4, columns.weights + 2 * i, [&] { return two(i); },
            [&] { return two(i + 2); });
    }
    return i;
}

inline size_t DrawPairs(uint8_t* dst, const uint8_t* src, size_t begin, size_t count,
                        const BilinearColumns& columns) {
    const auto at = [&](size_t i) { return src + static_cast<ptrdiff_t>(columns.left[i]) * 4; };
    size_t i = begin;
    for (; i + kPixels <= count; i += kPixels) {
        if constexpr (kHasMulAddBytes) {
            const auto two = [&](size_t from) {
                const Vec pairs = FromBlocks(
                    [&](size_t k) { return LoadHalves(at(from + 4 * k), at(from + 4 * k + 1)); });
                return ShuffleBytes(
                    pairs, RepeatBytes({0, 4, 1, 5, 2, 6, 3, 7, 8, 12, 9, 13, 10, 14, 11, 15}));
            };
            DrawPixels(
                dst + i * 4, columns.weights + 2 * i, [&] { return two(i); },
                [&] { return two(i + 2); });
        } else {
            // The fraction is the second of two weights. Vectors are one block here.
            const Vec f = ShiftRight16<8>(LoadHalf(columns.weights + 2 * i));
            const Vec twice = InterleaveLow16(f, f);
            const auto two = [&](size_t from, Vec fractions) {
                // The left pixels lie in the low half, the right ones in the high half.
                const Vec pixels =
                    FromBlocks([&](size_t) { return LoadInTurns32(at(from), at(from + 1)); });
                return Between(WidenLow8(pixels), WidenHigh8(pixels), fractions);
            };
            Store(dst + i * 4,
                  PackU16(two(i, DoubleLow32(twice)), two(i + 2, DoubleHigh32(twice))));
        }
    }
    return i;
}

} // namespace

void Bilinear(uint8_t* dst, const uint8_t* src, size_t count, const BilinearColumns& columns) {
    size_t i = 0;
    if constexpr (kHasMulAddBytes) {
        i = DrawShuffled(dst, src, columns);
    }
    i = DrawPairs(dst, src, i, count, columns);
    Bilinear_scalar(dst + i * 4, src, count - i, {columns.left + i, columns.weights + 2 * i});
}

void Lerp(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
          uint32_t fraction) {
    size_t i = 0;
    if constexpr (kHasMulAddBytes) {
        // Weights up to 127 fit in signed bytes. A fraction of 0 takes both halves from the upper
        // row.
        const uint8_t* second = fraction == 0 ? upper : lower;
        const uint32_t f = fraction == 0 ? 64 : fraction;
        const Vec weights = Splat16(f << 8 | (128 - f));
        for (; i + kPixels <= count; i += kPixels) {
            const Vec a = Load(upper + i * 4);
            const Vec b = Load(second + i * 4);
            const Vec low = MulAddBytes(InterleaveLow8(a, b), weights);
            const Vec high = MulAddBytes(InterleaveHigh8(a, b), weights);
            Store(dst + i * 4, PackU16(ShiftRight16<7>(low), ShiftRight16<7>(high)));
        }
    } else {
        const Vec fractions = Splat16(fraction);
        for (; i + kPixels <= count; i += kPixels) {
            const Vec a = Load(upper + i * 4);
            const Vec b = Load(lower + i * 4);
            Store(dst + i * 4, PackU16(Between(WidenLow8(a), WidenLow8(b), fractions),
                                       Between(WidenHigh8(a), WidenHigh8(b), fractions)));
        }
    }
    Lerp_scalar(dst + i * 4, upper + i * 4, lower + i * 4, count - i, fraction);
}

} // namespace kyv::KYV_VECTOR_SET
