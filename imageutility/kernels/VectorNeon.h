// The operations of Vector.h on 64-bit ARM, whose vectors are one block. Integers of any width
// share a type there, so each operation says what its lanes are by a cast, which keeps the bits.
#pragma once

#include <arm_neon.h>

namespace kyv::KYV_VECTOR_SET {
namespace {

using Vec = uint8x16_t;
using Block = Vec;
using Floats = float32x4_t;
using Doubles = float64x2_t;

inline constexpr bool kHasByteShuffle = true;
inline constexpr bool kHasMulAddBytes = false;
inline constexpr bool kHasMixWords = true;

#define KYV_BINARY(name, Lanes, instruction)                                                       \
    inline Vec name(Vec a, Vec b) {                                                                \
        return (Vec)instruction((Lanes)a, (Lanes)b);                                               \
    }
#define KYV_SHIFT(name, Lanes, instruction)                                                        \
    template <int kBits>                                                                           \
    inline Vec name(Vec v) {                                                                       \
        return (Vec)instruction((Lanes)v, kBits);                                                  \
    }
#define KYV_FLOATING(Type, name, instruction)                                                      \
    inline Type name(Type a, Type b) {                                                             \
        return instruction(a, b);                                                                  \
    }

// --- Memory and constants

inline Vec Load(const void* from) {
    return vld1q_u8(static_cast<const uint8_t*>(from));
}
inline void Store(void* to, Vec v) {
    vst1q_u8(static_cast<uint8_t*>(to), v);
}
inline Floats LoadF32(const float* from) {
    return vld1q_f32(from);
}
inline void StoreF32(float* to, Floats v) {
    vst1q_f32(to, v);
}
inline Vec Zero() {
    return vdupq_n_u8(0);
}
inline Vec Splat8(uint32_t byte) {
    return vdupq_n_u8(static_cast<uint8_t>(byte));
}
inline Vec Splat16(uint32_t word) {
    return (Vec)vdupq_n_u16(static_cast<uint16_t>(word));
}
inline Vec Splat32(uint32_t value) {
    return (Vec)vdupq_n_u32(value);
}
inline Vec Splat64(uint64_t value) {
    return (Vec)vdupq_n_u64(value);
}
inline Floats SplatF32(float value) {
    return vdupq_n_f32(value);
}
inline Doubles SplatF64(double value) {
    return vdupq_n_f64(value);
}
inline Vec Ascending32() {
    return (Vec)uint32x4_t{0, 1, 2, 3};
}
inline Vec LoadHalf(const void* from) {
    return vcombine_u8(vld1_u8(static_cast<const uint8_t*>(from)), vdup_n_u8(0));
}
inline Vec LoadBytes16(const uint8_t* from) {
    return (Vec)vmovl_u8(vld1_u8(from));
}
inline Vec LoadBytes32(const uint8_t* from) {
    uint32_t bytes;
    __builtin_memcpy(&bytes, from, sizeof bytes);
    return (Vec)vmovl_u16(vget_low_u16(vmovl_u8(vcreate_u8(bytes))));
}
inline Vec LoadWords32(const uint16_t* from) {
    return (Vec)vmovl_u16(vld1_u16(from));
}
inline Vec LoadWords64(const uint16_t* from) {
    return (Vec)vcombine_u16(vld1_dup_u16(from), vld1_dup_u16(from + 1));
}
inline void StoreBytes16(uint8_t* to, Vec words) {
    vst1_u8(to, vqmovun_s16((int16x8_t)words));
}
inline void Prefetch(const void* at) {
    __builtin_prefetch(at);
}

// --- Bits and comparisons

KYV_BINARY(And, uint8x16_t, vandq_u8)
KYV_BINARY(Or, uint8x16_t, vorrq_u8)
KYV_BINARY(Xor, uint8x16_t, veorq_u8)
KYV_BINARY(ClearBits, uint8x16_t, vbicq_u8)
inline Vec Select(Vec mask, Vec yes, Vec no) {
    return vbslq_u8(mask, yes, no);
}
KYV_BINARY(Equal8, uint8x16_t, vceqq_u8)
KYV_BINARY(Equal16, uint16x8_t, vceqq_u16)
KYV_BINARY(Equal32, uint32x4_t, vceqq_u32)
KYV_BINARY(GreaterS16, int16x8_t, vcgtq_s16)
KYV_BINARY(GreaterS32, int32x4_t, vcgtq_s32)
inline bool AllSet(Vec mask) {
    return vminvq_u8(mask) == 255;
}
inline bool AnySet(Vec mask) {
    return vmaxvq_u8(mask) != 0;
}

// --- Arithmetic

KYV_BINARY(Add8, uint8x16_t, vaddq_u8)
KYV_BINARY(Add16, uint16x8_t, vaddq_u16)
KYV_BINARY(Add32, uint32x4_t, vaddq_u32)
KYV_BINARY(AddSatU8, uint8x16_t, vqaddq_u8)
KYV_BINARY(Sub8, uint8x16_t, vsubq_u8)
KYV_BINARY(Sub16, uint16x8_t, vsubq_u16)
KYV_BINARY(Sub32, uint32x4_t, vsubq_u32)
KYV_BINARY(SubSatU8, uint8x16_t, vqsubq_u8)
KYV_BINARY(SubSatU16, uint16x8_t, vqsubq_u16)
KYV_BINARY(AverageU8, uint8x16_t, vrhaddq_u8)
KYV_BINARY(AverageU16, uint16x8_t, vrhaddq_u16)
KYV_BINARY(MinU8, uint8x16_t, vminq_u8)
KYV_BINARY(MaxU8, uint8x16_t, vmaxq_u8)
KYV_BINARY(MinS16, int16x8_t, vminq_s16)
KYV_BINARY(MaxS16, int16x8_t, vmaxq_s16)
KYV_BINARY(MulLow16, uint16x8_t, vmulq_u16)
KYV_BINARY(MulLow32, uint32x4_t, vmulq_u32)
// The sums of neighbours: those of the one, then of the other.
KYV_BINARY(AddNeighbours32, uint32x4_t, vpaddq_u32)

// Products at twice the width, first half and second half, whose high halves are gathered.
inline Vec MulHighU16(Vec a, Vec b) {
    const auto low = vmull_u16(vget_low_u16((uint16x8_t)a), vget_low_u16((uint16x8_t)b));
    const auto high = vmull_high_u16((uint16x8_t)a, (uint16x8_t)b);
    return (Vec)vuzp2q_u16((uint16x8_t)low, (uint16x8_t)high);
}
inline Vec MulHighS16(Vec a, Vec b) {
    const auto low = vmull_s16(vget_low_s16((int16x8_t)a), vget_low_s16((int16x8_t)b));
    const auto high = vmull_high_s16((int16x8_t)a, (int16x8_t)b);
    return (Vec)vuzp2q_s16((int16x8_t)low, (int16x8_t)high);
}
inline Vec MulHighU32(Vec a, Vec b) {
    const auto low = vmull_u32(vget_low_u32((uint32x4_t)a), vget_low_u32((uint32x4_t)b));
    const auto high = vmull_high_u32((uint32x4_t)a, (uint32x4_t)b);
    return (Vec)vuzp2q_u32((uint32x4_t)low, (uint32x4_t)high);
}
inline Vec MulEvenU32(Vec a, Vec b) {
    return (Vec)vmull_u32(vmovn_u64((uint64x2_t)a), vmovn_u64((uint64x2_t)b));
}
inline Vec MulAddPairs16(Vec a, Vec b) {
    const auto low = vmull_s16(vget_low_s16((int16x8_t)a), vget_low_s16((int16x8_t)b));
    const auto high = vmull_high_s16((int16x8_t)a, (int16x8_t)b);
    return (Vec)vpaddq_s32(low, high);
}
inline Vec MulRound20(Vec a, Vec b) {
    return (Vec)vqrdmulhq_s16(vshrq_n_s16((int16x8_t)a, 5), (int16x8_t)b);
}
inline Vec MulAddBytes(Vec unsignedBytes, Vec signedBytes) {
    const auto u = (uint16x8_t)unsignedBytes;
    const auto s = (int16x8_t)signedBytes;
    const int16x8_t even =
        vmulq_s16((int16x8_t)vandq_u16(u, vdupq_n_u16(255)), vshrq_n_s16(vshlq_n_s16(s, 8), 8));
    const int16x8_t odd = vmulq_s16((int16x8_t)vshrq_n_u16(u, 8), vshrq_n_s16(s, 8));
    return (Vec)vqaddq_s16(even, odd);
}

KYV_SHIFT(ShiftLeft16, uint16x8_t, vshlq_n_u16)
KYV_SHIFT(ShiftLeft32, uint32x4_t, vshlq_n_u32)
KYV_SHIFT(ShiftLeft64, uint64x2_t, vshlq_n_u64)
KYV_SHIFT(ShiftRight16, uint16x8_t, vshrq_n_u16)
KYV_SHIFT(ShiftRight32, uint32x4_t, vshrq_n_u32)
KYV_SHIFT(ShiftRight64, uint64x2_t, vshrq_n_u64)
KYV_SHIFT(ShiftRightS16, int16x8_t, vshrq_n_s16)
KYV_SHIFT(ShiftRightS32, int32x4_t, vshrq_n_s32)
inline Vec ShiftRightBy32(Vec v, int bits) {
    return (Vec)vshlq_u32((uint32x4_t)v, vdupq_n_s32(-bits));
}

// --- Lanes

KYV_BINARY(InterleaveLow8, uint8x16_t, vzip1q_u8)
KYV_BINARY(InterleaveHigh8, uint8x16_t, vzip2q_u8)
KYV_BINARY(InterleaveLow16, uint16x8_t, vzip1q_u16)
KYV_BINARY(InterleaveHigh16, uint16x8_t, vzip2q_u16)
KYV_BINARY(InterleaveLow32, uint32x4_t, vzip1q_u32)
KYV_BINARY(InterleaveHigh32, uint32x4_t, vzip2q_u32)
KYV_BINARY(InterleaveLow64, uint64x2_t, vzip1q_u64)
KYV_BINARY(InterleaveHigh64, uint64x2_t, vzip2q_u64)
inline Vec PackU16(Vec a, Vec b) {
    return vqmovun_high_s16(vqmovun_s16((int16x8_t)a), (int16x8_t)b);
}
inline Vec PackS16(Vec a, Vec b) {
    return (Vec)vqmovn_high_s16(vqmovn_s16((int16x8_t)a), (int16x8_t)b);
}
inline Vec PackS32(Vec a, Vec b) {
    return (Vec)vqmovn_high_s32(vqmovn_s32((int32x4_t)a), (int32x4_t)b);
}
inline Vec InOrder32(Vec v) {
    return v;
}
inline Vec InOrder64(Vec v) {
    return v;
}
inline void BlocksInOrder(Vec&, Vec&) {}
// An index below 0 is beyond the sixteen bytes, for which the instruction gives 0.
KYV_BINARY(ShuffleBytes, uint8x16_t, vqtbl1q_u8)
inline Vec MixWords(Vec even, Vec odd) {
    return Select(Splat32(0xFFFF), even, odd);
}
inline Vec DoubleEach64(Vec half) {
    return (Vec)vdupq_laneq_u64((uint64x2_t)half, 0);
}
inline Vec ExtendLowS16(Vec words) {
    return (Vec)vmovl_s16(vget_low_s16((int16x8_t)words));
}
inline Vec ExtendHighS16(Vec words) {
    return (Vec)vmovl_high_s16((int16x8_t)words);
}
inline Vec InterleaveHalves16(Vec v) {
    return (Vec)vzip1q_u16((uint16x8_t)v, vextq_u16((uint16x8_t)v, (uint16x8_t)v, 4));
}

// --- Blocks

inline Block LoadBlock(const void* from) {
    return Load(from);
}
inline Block LoadHalves(const void* first, const void* second) {
    return vcombine_u8(vld1_u8(static_cast<const uint8_t*>(first)),
                       vld1_u8(static_cast<const uint8_t*>(second)));
}
inline Block LoadInTurns32(const void* first, const void* second) {
    return InterleaveLow32(LoadHalf(first), LoadHalf(second));
}
inline Block LoadBlockWords32(const uint16_t* from) {
    return LoadWords32(from);
}
inline Block AddBlocks32(Block a, Block b) {
    return Add32(a, b);
}
inline Block SubBlocks32(Block a, Block b) {
    return Sub32(a, b);
}
template <class GetBlock>
inline Vec FromBlocks(GetBlock block) {
    return block(0);
}
inline Vec Repeat(Block block) {
    return block;
}
inline Vec RepeatBytes(const int8_t (&bytes)[16]) {
    return Load(bytes);
}
inline Block FirstBlock(Vec v) {
    return v;
}
inline Block SumOfBlocks32(Vec v) {
    return v;
}
inline Vec RunningSums32(Block& total, Vec change) {
    total = Add32(total, change);
    return total;
}
inline Vec SpreadOverBlocks32(const void* from) {
    uint32_t value;
    __builtin_memcpy(&value, from, sizeof value);
    return Splat32(value);
}
inline void StorePixel32(uint8_t* to, Vec v) {
    const Vec words = PackS32(v, v);
    const uint32_t pixel = vgetq_lane_u32((uint32x4_t)PackU16(words, words), 0);
    __builtin_memcpy(to, &pixel, sizeof pixel);
}

inline Vec AlphaWords(Vec pixels) {
    return ShuffleBytes(pixels,
                        RepeatBytes({3, -1, 3, -1, 7, -1, 7, -1, 11, -1, 11, -1, 15, -1, 15, -1}));
}
inline Vec SpreadHighWords(Vec v) {
    return ShuffleBytes(v, RepeatBytes({2, 2, 2, -1, 6, 6, 6, -1, 10, 10, 10, -1, 14, 14, 14, -1}));
}
inline Vec SecondBytes(Vec v) {
    return ShuffleBytes(
        v, RepeatBytes({-1, 2, -1, -1, -1, 6, -1, -1, -1, 10, -1, -1, -1, 14, -1, -1}));
}

// --- Floats and doubles

KYV_FLOATING(Floats, AddF32, vaddq_f32)
KYV_FLOATING(Floats, SubF32, vsubq_f32)
KYV_FLOATING(Floats, MulF32, vmulq_f32)
KYV_FLOATING(Floats, DivF32, vdivq_f32)
KYV_FLOATING(Doubles, AddF64, vaddq_f64)
KYV_FLOATING(Doubles, SubF64, vsubq_f64)
KYV_FLOATING(Doubles, MulF64, vmulq_f64)
KYV_FLOATING(Doubles, DivF64, vdivq_f64)
// This architecture's own minimum is not a number where one operand is none.
inline Floats MinF32(Floats a, Floats b) {
    return vbslq_f32(vcltq_f32(a, b), a, b);
}
inline Floats MaxF32(Floats a, Floats b) {
    return vbslq_f32(vcgtq_f32(a, b), a, b);
}
inline Doubles MinF64(Doubles a, Doubles b) {
    return vbslq_f64(vcltq_f64(a, b), a, b);
}
inline Doubles MaxF64(Doubles a, Doubles b) {
    return vbslq_f64(vcgtq_f64(a, b), a, b);
}
inline Doubles SelectLessF64(Doubles a, Doubles b, Doubles yes, Doubles no) {
    return vbslq_f64(vcltq_f64(a, b), yes, no);
}
inline Floats SqrtF32(Floats v) {
    return vsqrtq_f32(v);
}
inline Doubles SqrtF64(Doubles v) {
    return vsqrtq_f64(v);
}
inline Floats F32FromS32(Vec v) {
    return vcvtq_f32_s32((int32x4_t)v);
}
inline Vec TruncateF32(Floats v) {
    return (Vec)vcvtq_s32_f32(v);
}
inline Floats AsFloats(Vec bits) {
    return (Floats)bits;
}
inline Doubles LowF64(Floats v) {
    return vcvt_f64_f32(vget_low_f32(v));
}
inline Doubles HighF64(Floats v) {
    return vcvt_high_f64_f32(v);
}
inline Floats ToFloats(Doubles low, Doubles high) {
    return vcvt_high_f32_f64(vcvt_f32_f64(low), high);
}
inline Vec TruncateF64(Doubles low, Doubles high) {
    return (Vec)vmovn_high_s64(vmovn_s64(vcvtq_s64_f64(low)), vcvtq_s64_f64(high));
}
inline Vec AsVec64(Doubles v) {
    return (Vec)v;
}
inline Doubles FlipSign64(Doubles v, Vec signs) {
    return (Doubles)veorq_u8((Vec)v, signs);
}
inline Doubles NegateF64(Doubles v) {
    return vnegq_f64(v);
}

#undef KYV_BINARY
#undef KYV_SHIFT
#undef KYV_FLOATING

} // namespace
} // namespace kyv::KYV_VECTOR_SET
