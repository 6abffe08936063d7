// The vectors that the kernels are written in, one meaning at every width.
//
// Each _vector.cpp is compiled once for every instruction set of the target, with one macro that
// says which. Here that set becomes the namespace KYV_VECTOR_SET inside kyv, and gets the
// operations below; all of them are inline with internal linkage, so that nothing compiled for one
// set can stand in for another. Kernels use these names and no intrinsics. Where sets need
// different instructions the difference belongs here, under a name that says what is computed.
//
// A vector is a row of kBlocks blocks of 128 bits. Interleaving, packing and byte shuffles work
// within each block, at every width; data stays in that order from load to store, and only what has
// to leave it is put in order (InOrder32, InOrder64).
//
// Names end in the width of a lane: 8, 16, 32 or 64 bits; S is signed, U unsigned, Sat saturates.
//   Vec             integers of any width
//   Floats, Doubles single and double precision; every operation rounds once, to nearest
//   Block           128 bits
//   kBytes, kWords, kPixels, kLongs: lanes of 8, 16, 32 and 64 bits in a Vec
//
// Memory     Load Store LoadHalf StoreHalf LoadBytes16 LoadBytes32 LoadWords32 StoreBytes16
//            LoadF32 StoreF32; all unaligned. LoadBytes16: kWords bytes as words; StoreBytes16: the
//            way back, words of 0..255. LoadBytes32, LoadWords32: kPixels bytes or words as 32
//            bits.
// Blocks     LoadBlock LoadHalves (two times 8 bytes) FromBlocks (one from a function of its
// number)
//            GetBlock Repeat (the same block everywhere)
// Constants  Zero Splat8 Splat16 Splat32 Splat64 PixelWords (four words, repeated) PairOfWords (low
//            and high word of every 32 bits) Ascending32 (0, 1, 2 ...)
// Bits       And Or Xor ClearBits(v, bits) Select(mask, yes, no): masks are all ones or zeros
// Compare    Equal8 Equal16 Equal32 GreaterS16 GreaterS32 -> mask; AllSet AnySet of a mask
// Arithmetic Add8 Add16 Add32 AddSatU8 Sub8 Sub16 Sub32 SubSatU8 SubSatU16 AverageU8 AverageU16
//            (rounded up) MinU8 MaxU8 MinS16 MaxS16 MulLow16 MulLow32 MulHighU16 MulHighS16
//            MulAddPairs16 (a0 * b0 + a1 * b1, signed, 32 bits) MulRound15
// Shifts     ShiftLeft16<n> ShiftRight16<n> ShiftRightS16<n>, the same with 32, ShiftLeft64
//            ShiftRight64; ShiftRightBy32(v, n) by a number known only when it runs
// Lanes      InterleaveLow8 .. 64 InterleaveHigh8 .. 64 PackU16 (words to bytes, saturated) PackS16
//            (to signed bytes) PackS32 (to words) MixWords(even, odd) TwiceLow16 DoubleLow32
//            DoubleHigh32 InterleaveHalves16 AlphaWords InOrder32 InOrder64
// Floats     SplatF32 AddF32 SubF32 MulF32 DivF32 MinF32 MaxF32 SqrtF32 F32FromS32 TruncateF32
//            (the last operand of MinF32 and MaxF32 is the result where one is not a number)
// Doubles    the same with 64, NegateF64 LowF64 HighF64 (of Floats) ToFloats(low, high) AsVec64
//            FlipSign64 SelectLessF64
// From SSSE3 on (kHasByteShuffle): ShuffleBytes(v, indices) MulAddBytes (unsigned times signed)
#pragma once

#include <stddef.h>
#include <stdint.h>

#if defined(KYV_VECTOR_SET_SSE2)
#define KYV_VECTOR_SET sse2
#elif defined(KYV_VECTOR_SET_SSSE3)
#define KYV_VECTOR_SET ssse3
#elif defined(KYV_VECTOR_SET_AVX2)
#define KYV_VECTOR_SET avx2
#elif defined(KYV_VECTOR_SET_AVX512)
#define KYV_VECTOR_SET avx512
#else
#error "A vector file is compiled for one of the instruction sets that the build names."
#endif

#include "imageutility/kernels/VectorX86.h"

// What is made of those operations alone, whatever the architecture.
namespace kyv::KYV_VECTOR_SET {
namespace {

inline constexpr size_t kBlocks = sizeof(Vec) / 16;
inline constexpr size_t kBytes = sizeof(Vec);
inline constexpr size_t kWords = sizeof(Vec) / 2;
inline constexpr size_t kPixels = sizeof(Vec) / 4;
inline constexpr size_t kLongs = sizeof(Vec) / 8;

// The low and the high 16 bits of every 32, both signed.
inline Vec PairOfWords(int low, int high) {
    return Splat32(static_cast<uint32_t>(high) << 16 | (static_cast<uint32_t>(low) & 0xFFFF));
}

// A word for each byte of a pixel.
inline Vec PixelWords(const uint16_t* words) {
    uint64_t pixel;
    __builtin_memcpy(&pixel, words, sizeof pixel);
    return Splat64(pixel);
}
inline Vec PixelWords(int b, int g, int r, int a) {
    const uint16_t words[4] = {static_cast<uint16_t>(b), static_cast<uint16_t>(g),
                               static_cast<uint16_t>(r), static_cast<uint16_t>(a)};
    return PixelWords(words);
}

// Bytes of each block as words: its first half, its second half.
inline Vec WidenLow8(Vec v) {
    return InterleaveLow8(v, Zero());
}
inline Vec WidenHigh8(Vec v) {
    return InterleaveHigh8(v, Zero());
}

// A number below 65536 in every 32 bits, as both of its words.
inline Vec TwiceLow16(Vec v) {
    return Or(v, ShiftLeft32<16>(v));
}

// Of each block the first two numbers of 32 bits, or the last two, each one twice.
inline Vec DoubleLow32(Vec v) {
    return InterleaveLow32(v, v);
}
inline Vec DoubleHigh32(Vec v) {
    return InterleaveHigh32(v, v);
}

} // namespace
} // namespace kyv::KYV_VECTOR_SET
