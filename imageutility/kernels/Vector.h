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
// Memory     Load Store LoadF32 StoreF32: unaligned, as all of them. LoadHalf: half a vector, the
//            rest is undefined. LoadBytes16, LoadBytes32, LoadWords32: bytes or words as wider
//            numbers, a vector full; LoadWords64: kLongs words, each four times; StoreBytes16:
//            words of 0..255 as bytes. StorePixel32 Prefetch
// Blocks     LoadBlock LoadHalves (eight bytes from each of two places) LoadInTurns32
//            LoadBlockWords32 AddBlocks32 SubBlocks32; FromBlocks (each from a function of its
//            number) Repeat (the same in every block) RepeatBytes FirstBlock SumOfBlocks32
//            RunningSums32(total, changes): adds one block after the other to total, and gives all
//            totals on the way; SpreadOverBlocks32: kBlocks numbers, each four times
// Constants  Zero Splat8 .. Splat64 PixelWords (four words, repeated) PairOfWords (the low and the
//            high word of every 32 bits) Ascending32 (0, 1, 2 ...)
// Bits       And Or Xor ClearBits(v, bits) Select(mask, yes, no)
// Compare    Equal8 .. Equal32 GreaterS16 GreaterS32 give masks, all ones or zeros in a lane;
//            AllSet and AnySet of a mask
// Arithmetic Add8 .. Add32 Sub8 .. Sub32 AddSatU8 SubSatU8 SubSatU16 AverageU8 AverageU16 (rounded
//            up) MinU8 MaxU8 MinS16 MaxS16 MulLow16 MulLow32 MulHighU16 MulHighS16 MulHighU32
//            MulEvenU32: the even numbers' products in 64 bits; MulAddPairs16: a0 * b0 + a1 * b1
//            of signed words in 32 bits; MulRound20: ((a >> 5) * b + 2^14) >> 15 of signed words
// Shifts     ShiftLeft16<n> ShiftRight16<n> ShiftRightS16<n>, the same with 32, ShiftLeft64
//            ShiftRight64; ShiftRightBy32(v, n) by a number known only when it runs
// Lanes      InterleaveLow8 .. 64, InterleaveHigh8 .. 64 of each block's first or last half;
//            PackU16 (words to bytes, saturated) PackS16 (to signed bytes) PackS32 (to words);
//            InOrder32 and InOrder64 undo what two packings, or one, do to the order of blocks.
//            WidenLow8 WidenHigh8: a block's bytes as words. ExtendLowS16 ExtendHighS16: the
//            vector's first or last half as 32 bits. MixWords(even, odd) TwiceLow16 DoubleLow32
//            DoubleHigh32 DoubleEach64 (of half a vector) InterleaveHalves16 AlphaWords
//            BlocksInOrder AddNeighbours32 SpreadHighWords SecondBytes
// Floats     SplatF32 AddF32 SubF32 MulF32 DivF32 MinF32 MaxF32 SqrtF32 F32FromS32 TruncateF32
//            AsFloats (the bits); MinF32 and MaxF32 give the last operand where one is not a number
// Doubles    SplatF64 AddF64 SubF64 MulF64 DivF64 MinF64 MaxF64 SqrtF64 NegateF64, kLongs of them;
//            LowF64 HighF64 (of Floats) ToFloats(low, high) TruncateF64(low, high) AsVec64
//            FlipSign64 SelectLessF64(a, b, yes, no): yes where a < b
// Bytes      ShuffleBytes(v, indices) within each block, 0 for an index below 0; MulAddBytes
//            (unsigned, signed): words a0 * b0 + a1 * b1, saturated.
// ShuffleBytes, MulAddBytes and MixWords take several instructions where kHasByteShuffle,
// kHasMulAddBytes or kHasMixWords is false; a kernel that has another way may ask.
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
#elif defined(KYV_VECTOR_SET_NEON)
#define KYV_VECTOR_SET neon
#else
#error "A vector file is compiled for one of the instruction sets that the build names."
#endif

#ifdef KYV_VECTOR_SET_NEON
#include "imageutility/kernels/VectorNeon.h"
#else
#include "imageutility/kernels/VectorX86.h"
#endif

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
