// The operations of Vector.h on x86-64: SSE2, SSSE3, AVX2, and AVX-512 with bytes and words. Most
// of them have the same name at every width but for the prefix; what differs follows below.
#pragma once

#include <immintrin.h>

#if defined(KYV_VECTOR_SET_AVX512)
#define KYV_MM(name) _mm512_##name
#define KYV_MM_SI(name) _mm512_##name##_si512
#elif defined(KYV_VECTOR_SET_AVX2)
#define KYV_MM(name) _mm256_##name
#define KYV_MM_SI(name) _mm256_##name##_si256
#else
#define KYV_MM(name) _mm_##name
#define KYV_MM_SI(name) _mm_##name##_si128
#endif

namespace kyv::KYV_VECTOR_SET {
namespace {

using Block = __m128i;
#if defined(KYV_VECTOR_SET_AVX512)
using Vec = __m512i;
using Floats = __m512;
using Doubles = __m512d;
#elif defined(KYV_VECTOR_SET_AVX2)
using Vec = __m256i;
using Floats = __m256;
using Doubles = __m256d;
#else
using Vec = __m128i;
using Floats = __m128;
using Doubles = __m128d;
#endif

// --- Memory and constants

inline Vec Load(const void* from) {
    return KYV_MM_SI(loadu)(static_cast<const Vec*>(from));
}
inline void Store(void* to, Vec v) {
    KYV_MM_SI(storeu)(static_cast<Vec*>(to), v);
}
inline Floats LoadF32(const float* from) {
    return KYV_MM(loadu_ps)(from);
}
inline void StoreF32(float* to, Floats v) {
    KYV_MM(storeu_ps)(to, v);
}
inline Vec Zero() {
    return KYV_MM_SI(setzero)();
}
inline Vec Splat8(uint32_t byte) {
    return KYV_MM(set1_epi8)(static_cast<char>(byte));
}
inline Vec Splat16(uint32_t word) {
    return KYV_MM(set1_epi16)(static_cast<short>(word));
}
inline Vec Splat32(uint32_t value) {
    return KYV_MM(set1_epi32)(static_cast<int>(value));
}
inline Floats SplatF32(float value) {
    return KYV_MM(set1_ps)(value);
}
inline Doubles SplatF64(double value) {
    return KYV_MM(set1_pd)(value);
}

// --- Operations alike at every width

#define KYV_UNARY(Result, name, Argument, instruction)                                             \
    inline Result name(Argument a) {                                                               \
        return KYV_MM(instruction)(a);                                                             \
    }
#define KYV_BINARY(Type, name, instruction)                                                        \
    inline Type name(Type a, Type b) {                                                             \
        return KYV_MM(instruction)(a, b);                                                          \
    }
#define KYV_SHIFT(name, instruction)                                                               \
    template <int kBits>                                                                           \
    inline Vec name(Vec v) {                                                                       \
        return KYV_MM(instruction)(v, kBits);                                                      \
    }

inline Vec And(Vec a, Vec b) {
    return KYV_MM_SI(and)(a, b);
}
inline Vec Or(Vec a, Vec b) {
    return KYV_MM_SI(or)(a, b);
}
inline Vec Xor(Vec a, Vec b) {
    return KYV_MM_SI(xor)(a, b);
}
inline Vec ClearBits(Vec v, Vec bits) {
    return KYV_MM_SI(andnot)(bits, v);
}

KYV_BINARY(Vec, Add8, add_epi8)
KYV_BINARY(Vec, Add16, add_epi16)
KYV_BINARY(Vec, Add32, add_epi32)
KYV_BINARY(Vec, AddSatU8, adds_epu8)
KYV_BINARY(Vec, Sub8, sub_epi8)
KYV_BINARY(Vec, Sub16, sub_epi16)
KYV_BINARY(Vec, Sub32, sub_epi32)
KYV_BINARY(Vec, SubSatU8, subs_epu8)
KYV_BINARY(Vec, SubSatU16, subs_epu16)
KYV_BINARY(Vec, AverageU8, avg_epu8)
KYV_BINARY(Vec, AverageU16, avg_epu16)
KYV_BINARY(Vec, MinU8, min_epu8)
KYV_BINARY(Vec, MaxU8, max_epu8)
KYV_BINARY(Vec, MinS16, min_epi16)
KYV_BINARY(Vec, MaxS16, max_epi16)
KYV_BINARY(Vec, MulLow16, mullo_epi16)
KYV_BINARY(Vec, MulHighU16, mulhi_epu16)
KYV_BINARY(Vec, MulHighS16, mulhi_epi16)
KYV_BINARY(Vec, MulAddPairs16, madd_epi16)
KYV_BINARY(Vec, MulEvenU32, mul_epu32)

KYV_SHIFT(ShiftLeft16, slli_epi16)
KYV_SHIFT(ShiftLeft32, slli_epi32)
KYV_SHIFT(ShiftLeft64, slli_epi64)
KYV_SHIFT(ShiftRight16, srli_epi16)
KYV_SHIFT(ShiftRight32, srli_epi32)
KYV_SHIFT(ShiftRight64, srli_epi64)
KYV_SHIFT(ShiftRightS16, srai_epi16)
KYV_SHIFT(ShiftRightS32, srai_epi32)

inline Vec ShiftRightBy32(Vec v, int bits) {
    return KYV_MM(srl_epi32)(v, _mm_cvtsi32_si128(bits));
}

KYV_BINARY(Vec, InterleaveLow8, unpacklo_epi8)
KYV_BINARY(Vec, InterleaveHigh8, unpackhi_epi8)
KYV_BINARY(Vec, InterleaveLow16, unpacklo_epi16)
KYV_BINARY(Vec, InterleaveHigh16, unpackhi_epi16)
KYV_BINARY(Vec, InterleaveLow32, unpacklo_epi32)
KYV_BINARY(Vec, InterleaveHigh32, unpackhi_epi32)
KYV_BINARY(Vec, InterleaveLow64, unpacklo_epi64)
KYV_BINARY(Vec, InterleaveHigh64, unpackhi_epi64)
KYV_BINARY(Vec, PackU16, packus_epi16)
KYV_BINARY(Vec, PackS16, packs_epi16)
KYV_BINARY(Vec, PackS32, packs_epi32)

KYV_BINARY(Floats, AddF32, add_ps)
KYV_BINARY(Floats, SubF32, sub_ps)
KYV_BINARY(Floats, MulF32, mul_ps)
KYV_BINARY(Floats, DivF32, div_ps)
KYV_BINARY(Floats, MinF32, min_ps)
KYV_BINARY(Floats, MaxF32, max_ps)
KYV_UNARY(Floats, SqrtF32, Floats, sqrt_ps)
KYV_UNARY(Floats, F32FromS32, Vec, cvtepi32_ps)
KYV_UNARY(Vec, TruncateF32, Floats, cvttps_epi32)

KYV_BINARY(Doubles, AddF64, add_pd)
KYV_BINARY(Doubles, SubF64, sub_pd)
KYV_BINARY(Doubles, MulF64, mul_pd)
KYV_BINARY(Doubles, DivF64, div_pd)
KYV_BINARY(Doubles, MinF64, min_pd)
KYV_BINARY(Doubles, MaxF64, max_pd)
KYV_UNARY(Doubles, SqrtF64, Doubles, sqrt_pd)

// --- Byte shuffles and products, from SSSE3 on

#if defined(KYV_VECTOR_SET_SSE2)
// These two take many instructions here, so kernels ask first.
inline constexpr bool kHasByteShuffle = false;
inline constexpr bool kHasMulAddBytes = false;

inline Vec ShuffleBytes(Vec v, Vec indices) {
    uint8_t from[16], at[16], to[16];
    Store(from, v);
    Store(at, indices);
    for (int i = 0; i < 16; ++i) {
        to[i] = at[i] & 0x80 ? 0 : from[at[i] & 15];
    }
    return Load(to);
}
inline Vec MulAddBytes(Vec unsignedBytes, Vec signedBytes) {
    const Vec even =
        MulLow16(And(unsignedBytes, Splat16(0xFF)), ShiftRightS16<8>(ShiftLeft16<8>(signedBytes)));
    const Vec odd = MulLow16(ShiftRight16<8>(unsignedBytes), ShiftRightS16<8>(signedBytes));
    return _mm_adds_epi16(even, odd);
}

inline Vec MulRound20(Vec a, Vec b) {
    // The half is the top bit of what the high half of the product leaves out.
    const Vec x = ShiftRightS16<4>(a);
    return Add16(MulHighS16(x, b), ShiftRight16<15>(MulLow16(x, b)));
}
inline Vec AlphaWords(Vec pixels) {
    const Vec alpha = ShiftRight32<24>(pixels);
    return Or(alpha, ShiftLeft32<16>(alpha));
}
inline Vec InterleaveHalves16(Vec v) {
    return _mm_unpacklo_epi16(v, _mm_unpackhi_epi64(v, v));
}
inline Vec SpreadHighWords(Vec v) {
    const Vec one = _mm_srli_epi32(v, 16);
    return Or(Or(one, _mm_slli_epi32(one, 8)), _mm_slli_epi32(one, 16));
}
inline Vec SecondBytes(Vec v) {
    return And(_mm_srli_epi32(v, 8), Splat32(0xFF00));
}
#else
inline constexpr bool kHasByteShuffle = true;
inline constexpr bool kHasMulAddBytes = true;

// Within each block the byte that the index names, or 0 for an index below 0.
KYV_BINARY(Vec, ShuffleBytes, shuffle_epi8)
// Words a0 * b0 + a1 * b1, saturated.
KYV_BINARY(Vec, MulAddBytes, maddubs_epi16)
inline Vec MulRound20(Vec a, Vec b) {
    return KYV_MM(mulhrs_epi16)(ShiftRightS16<5>(a), b);
}
#endif

#if defined(KYV_VECTOR_SET_SSE2) || defined(KYV_VECTOR_SET_SSSE3)
inline constexpr bool kHasMixWords = false;
#else
inline constexpr bool kHasMixWords = true;
#endif

// --- AVX-512

#if defined(KYV_VECTOR_SET_AVX512)

inline Vec Splat64(uint64_t value) {
    return _mm512_set1_epi64(static_cast<long long>(value));
}
inline Vec Ascending32() {
    return _mm512_setr_epi32(0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15);
}
inline Vec Repeat(Block block) {
    return _mm512_broadcast_i32x4(block);
}
template <class GetBlock>
inline Vec FromBlocks(GetBlock block) {
    const __m256i low = _mm256_inserti128_si256(_mm256_castsi128_si256(block(0)), block(1), 1);
    const __m256i high = _mm256_inserti128_si256(_mm256_castsi128_si256(block(2)), block(3), 1);
    return _mm512_inserti64x4(_mm512_castsi256_si512(low), high, 1);
}
inline Vec LoadHalf(const void* from) {
    return _mm512_castsi256_si512(_mm256_loadu_si256(static_cast<const __m256i*>(from)));
}
inline Vec LoadBytes16(const uint8_t* from) {
    return _mm512_cvtepu8_epi16(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(from)));
}
inline Vec LoadBytes32(const uint8_t* from) {
    return _mm512_cvtepu8_epi32(_mm_loadu_si128(reinterpret_cast<const __m128i*>(from)));
}
inline Vec LoadWords32(const uint16_t* from) {
    return _mm512_cvtepu16_epi32(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(from)));
}
inline void StoreBytes16(uint8_t* to, Vec words) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), _mm512_cvtepi16_epi8(words));
}
inline Vec Select(Vec mask, Vec yes, Vec no) {
    return _mm512_ternarylogic_epi32(mask, yes, no, 0xCA);
}
inline Vec Equal8(Vec a, Vec b) {
    return _mm512_movm_epi8(_mm512_cmpeq_epi8_mask(a, b));
}
inline Vec Equal16(Vec a, Vec b) {
    return _mm512_movm_epi16(_mm512_cmpeq_epi16_mask(a, b));
}
inline Vec Equal32(Vec a, Vec b) {
    return _mm512_movm_epi32(_mm512_cmpeq_epi32_mask(a, b));
}
inline Vec GreaterS16(Vec a, Vec b) {
    return _mm512_movm_epi16(_mm512_cmpgt_epi16_mask(a, b));
}
inline Vec GreaterS32(Vec a, Vec b) {
    return _mm512_movm_epi32(_mm512_cmpgt_epi32_mask(a, b));
}
inline bool AllSet(Vec mask) {
    return _mm512_movepi8_mask(mask) == ~__mmask64{0};
}
inline bool AnySet(Vec mask) {
    return _mm512_test_epi32_mask(mask, mask) != 0;
}
KYV_BINARY(Vec, MulLow32, mullo_epi32)
inline Vec MixWords(Vec even, Vec odd) {
    return _mm512_mask_blend_epi16(0xAAAAAAAA, even, odd);
}
// The numbers of 32 bits as they were before two packings, or of 64 bits before one.
inline Vec InOrder32(Vec v) {
    return _mm512_permutexvar_epi32(
        _mm512_setr_epi32(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15), v);
}
inline Vec InOrder64(Vec v) {
    return _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 2, 4, 6, 1, 3, 5, 7), v);
}
inline Vec DoubleEach64(Vec half) {
    return _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 0, 1, 1, 2, 2, 3, 3), half);
}
inline Vec ExtendLowS16(Vec words) {
    return _mm512_cvtepi16_epi32(_mm512_castsi512_si256(words));
}
inline Vec ExtendHighS16(Vec words) {
    return _mm512_cvtepi16_epi32(_mm512_extracti64x4_epi64(words, 1));
}
inline Vec MulHighU32(Vec a, Vec b) {
    const Vec even = _mm512_mul_epu32(a, b);
    const Vec odd = _mm512_mul_epu32(_mm512_srli_epi64(a, 32), _mm512_srli_epi64(b, 32));
    return _mm512_mask_blend_epi32(0xAAAA, _mm512_srli_epi64(even, 32), odd);
}
inline Floats AsFloats(Vec bits) {
    return _mm512_castsi512_ps(bits);
}
inline Block FirstBlock(Vec v) {
    return _mm512_castsi512_si128(v);
}
inline Vec SpreadOverBlocks32(const void* from) {
    return _mm512_permutexvar_epi32(
        _mm512_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1, 2, 2, 2, 2, 3, 3, 3, 3),
        _mm512_castsi128_si512(_mm_loadu_si128(static_cast<const __m128i*>(from))));
}
inline Block SumOfBlocks32(Vec v) {
    const __m256i two =
        _mm256_add_epi32(_mm512_castsi512_si256(v), _mm512_extracti64x4_epi64(v, 1));
    return _mm_add_epi32(_mm256_castsi256_si128(two), _mm256_extracti128_si256(two, 1));
}
inline Vec RunningSums32(Block& total, Vec change) {
    const Vec zero = _mm512_setzero_si512();
    const Vec two = _mm512_add_epi32(change, _mm512_alignr_epi32(change, zero, 12));
    const Vec all = _mm512_add_epi32(two, _mm512_alignr_epi32(two, zero, 8));
    const Vec sums = _mm512_add_epi32(all, _mm512_broadcast_i32x4(total));
    total = _mm_add_epi32(total, _mm512_extracti32x4_epi32(all, 3));
    return sums;
}

// Each of kLongs words in all four words of 64 bits.
inline Vec LoadWords64(const uint16_t* from) {
    const Vec words =
        _mm512_cvtepu16_epi64(_mm_loadu_si128(reinterpret_cast<const __m128i*>(from)));
    return _mm512_shuffle_epi8(words,
                               _mm512_set4_epi32(0x09080908, 0x09080908, 0x01000100, 0x01000100));
}
// Two vectors whose blocks alternate between them, put one after the other.
inline void BlocksInOrder(Vec& low, Vec& high) {
    const Vec first =
        _mm512_permutex2var_epi64(low, _mm512_setr_epi64(0, 1, 8, 9, 2, 3, 10, 11), high);
    high = _mm512_permutex2var_epi64(low, _mm512_setr_epi64(4, 5, 12, 13, 6, 7, 14, 15), high);
    low = first;
}
inline Doubles LowF64(Floats v) {
    return _mm512_cvtps_pd(_mm512_castps512_ps256(v));
}
inline Doubles HighF64(Floats v) {
    return _mm512_cvtps_pd(_mm512_extractf32x8_ps(v, 1));
}
inline Floats ToFloats(Doubles low, Doubles high) {
    return _mm512_insertf32x8(_mm512_castps256_ps512(_mm512_cvtpd_ps(low)), _mm512_cvtpd_ps(high),
                              1);
}
inline Vec TruncateF64(Doubles low, Doubles high) {
    return _mm512_inserti64x4(_mm512_castsi256_si512(_mm512_cvttpd_epi32(low)),
                              _mm512_cvttpd_epi32(high), 1);
}
inline Vec AsVec64(Doubles v) {
    return _mm512_castpd_si512(v);
}
inline Doubles FlipSign64(Doubles v, Vec signs) {
    return _mm512_xor_pd(v, _mm512_castsi512_pd(signs));
}
inline Doubles SelectLessF64(Doubles a, Doubles b, Doubles yes, Doubles no) {
    return _mm512_mask_blend_pd(_mm512_cmp_pd_mask(a, b, _CMP_LT_OQ), no, yes);
}

// --- AVX2

#elif defined(KYV_VECTOR_SET_AVX2)

inline Vec Splat64(uint64_t value) {
    return _mm256_set1_epi64x(static_cast<long long>(value));
}
inline Vec Ascending32() {
    return _mm256_setr_epi32(0, 1, 2, 3, 4, 5, 6, 7);
}
inline Vec Repeat(Block block) {
    return _mm256_broadcastsi128_si256(block);
}
template <class GetBlock>
inline Vec FromBlocks(GetBlock block) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(block(0)), block(1), 1);
}
inline Vec LoadHalf(const void* from) {
    return _mm256_castsi128_si256(_mm_loadu_si128(static_cast<const __m128i*>(from)));
}
inline Vec LoadBytes16(const uint8_t* from) {
    return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(from)));
}
inline Vec LoadBytes32(const uint8_t* from) {
    return _mm256_cvtepu8_epi32(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from)));
}
inline Vec LoadWords32(const uint16_t* from) {
    return _mm256_cvtepu16_epi32(_mm_loadu_si128(reinterpret_cast<const __m128i*>(from)));
}
inline void StoreBytes16(uint8_t* to, Vec words) {
    _mm_storeu_si128(
        reinterpret_cast<__m128i*>(to),
        _mm_packus_epi16(_mm256_castsi256_si128(words), _mm256_extracti128_si256(words, 1)));
}
inline Vec Select(Vec mask, Vec yes, Vec no) {
    return _mm256_blendv_epi8(no, yes, mask);
}
KYV_BINARY(Vec, Equal8, cmpeq_epi8)
KYV_BINARY(Vec, Equal16, cmpeq_epi16)
KYV_BINARY(Vec, Equal32, cmpeq_epi32)
KYV_BINARY(Vec, GreaterS16, cmpgt_epi16)
KYV_BINARY(Vec, GreaterS32, cmpgt_epi32)
inline bool AllSet(Vec mask) {
    return _mm256_movemask_epi8(mask) == -1;
}
inline bool AnySet(Vec mask) {
    return !_mm256_testz_si256(mask, mask);
}
KYV_BINARY(Vec, MulLow32, mullo_epi32)
inline Vec MixWords(Vec even, Vec odd) {
    return _mm256_blend_epi16(even, odd, 0xAA);
}
inline Vec InOrder32(Vec v) {
    return _mm256_permutevar8x32_epi32(v, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
}
inline Vec InOrder64(Vec v) {
    return _mm256_permute4x64_epi64(v, _MM_SHUFFLE(3, 1, 2, 0));
}
inline Vec DoubleEach64(Vec half) {
    return _mm256_permute4x64_epi64(half, _MM_SHUFFLE(1, 1, 0, 0));
}
inline Vec ExtendLowS16(Vec words) {
    return _mm256_cvtepi16_epi32(_mm256_castsi256_si128(words));
}
inline Vec ExtendHighS16(Vec words) {
    return _mm256_cvtepi16_epi32(_mm256_extracti128_si256(words, 1));
}
inline Vec MulHighU32(Vec a, Vec b) {
    const Vec even = _mm256_mul_epu32(a, b);
    const Vec odd = _mm256_mul_epu32(_mm256_srli_epi64(a, 32), _mm256_srli_epi64(b, 32));
    return _mm256_blend_epi32(_mm256_srli_epi64(even, 32), odd, 0xAA);
}
inline Floats AsFloats(Vec bits) {
    return _mm256_castsi256_ps(bits);
}
inline Block FirstBlock(Vec v) {
    return _mm256_castsi256_si128(v);
}
inline Vec SpreadOverBlocks32(const void* from) {
    return _mm256_permutevar8x32_epi32(
        _mm256_castsi128_si256(_mm_loadl_epi64(static_cast<const __m128i*>(from))),
        _mm256_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1));
}
inline Block SumOfBlocks32(Vec v) {
    return _mm_add_epi32(_mm256_castsi256_si128(v), _mm256_extracti128_si256(v, 1));
}
inline Vec RunningSums32(Block& total, Vec change) {
    const Block first = _mm_add_epi32(total, _mm256_castsi256_si128(change));
    total = _mm_add_epi32(first, _mm256_extracti128_si256(change, 1));
    return _mm256_inserti128_si256(_mm256_castsi128_si256(first), total, 1);
}

inline Vec LoadWords64(const uint16_t* from) {
    const Vec words =
        _mm256_cvtepu16_epi64(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from)));
    return _mm256_shuffle_epi8(words, _mm256_broadcastsi128_si256(_mm_setr_epi32(
                                          0x01000100, 0x01000100, 0x09080908, 0x09080908)));
}
inline void BlocksInOrder(Vec& low, Vec& high) {
    const Vec first = _mm256_permute2x128_si256(low, high, 0x20);
    high = _mm256_permute2x128_si256(low, high, 0x31);
    low = first;
}
inline Doubles LowF64(Floats v) {
    return _mm256_cvtps_pd(_mm256_castps256_ps128(v));
}
inline Doubles HighF64(Floats v) {
    return _mm256_cvtps_pd(_mm256_extractf128_ps(v, 1));
}
inline Floats ToFloats(Doubles low, Doubles high) {
    return _mm256_set_m128(_mm256_cvtpd_ps(high), _mm256_cvtpd_ps(low));
}
inline Vec TruncateF64(Doubles low, Doubles high) {
    return _mm256_set_m128i(_mm256_cvttpd_epi32(high), _mm256_cvttpd_epi32(low));
}
inline Vec AsVec64(Doubles v) {
    return _mm256_castpd_si256(v);
}
inline Doubles FlipSign64(Doubles v, Vec signs) {
    return _mm256_xor_pd(v, _mm256_castsi256_pd(signs));
}
inline Doubles SelectLessF64(Doubles a, Doubles b, Doubles yes, Doubles no) {
    return _mm256_blendv_pd(no, yes, _mm256_cmp_pd(a, b, _CMP_LT_OQ));
}

// --- SSE2 and SSSE3

#else

inline Vec Splat64(uint64_t value) {
    return _mm_set1_epi64x(static_cast<long long>(value));
}
inline Vec Ascending32() {
    return _mm_setr_epi32(0, 1, 2, 3);
}
inline Vec Repeat(Block block) {
    return block;
}
template <class GetBlock>
inline Vec FromBlocks(GetBlock block) {
    return block(0);
}
inline Vec LoadHalf(const void* from) {
    return _mm_loadl_epi64(static_cast<const __m128i*>(from));
}
inline Vec LoadBytes16(const uint8_t* from) {
    return _mm_unpacklo_epi8(LoadHalf(from), Zero());
}
inline Vec LoadBytes32(const uint8_t* from) {
    int32_t bytes;
    __builtin_memcpy(&bytes, from, sizeof bytes);
    return _mm_unpacklo_epi16(_mm_unpacklo_epi8(_mm_cvtsi32_si128(bytes), Zero()), Zero());
}
inline Vec LoadWords32(const uint16_t* from) {
    return _mm_unpacklo_epi16(LoadHalf(from), Zero());
}
inline void StoreBytes16(uint8_t* to, Vec words) {
    _mm_storel_epi64(reinterpret_cast<__m128i*>(to), _mm_packus_epi16(words, words));
}
inline Vec Select(Vec mask, Vec yes, Vec no) {
    return Or(And(mask, yes), ClearBits(no, mask));
}
KYV_BINARY(Vec, Equal8, cmpeq_epi8)
KYV_BINARY(Vec, Equal16, cmpeq_epi16)
KYV_BINARY(Vec, Equal32, cmpeq_epi32)
KYV_BINARY(Vec, GreaterS16, cmpgt_epi16)
KYV_BINARY(Vec, GreaterS32, cmpgt_epi32)
inline bool AllSet(Vec mask) {
    return _mm_movemask_epi8(mask) == 0xFFFF;
}
inline bool AnySet(Vec mask) {
    return _mm_movemask_epi8(mask) != 0;
}
// The low half of a product is the same signed and unsigned.
inline Vec MulLow32(Vec a, Vec b) {
    const Vec even = _mm_shuffle_epi32(_mm_mul_epu32(a, b), _MM_SHUFFLE(3, 1, 2, 0));
    const Vec odd = _mm_shuffle_epi32(_mm_mul_epu32(_mm_srli_epi64(a, 32), _mm_srli_epi64(b, 32)),
                                      _MM_SHUFFLE(3, 1, 2, 0));
    return _mm_unpacklo_epi32(even, odd);
}
inline Vec MixWords(Vec even, Vec odd) {
    const Vec low = Splat32(0xFFFF);
    return Or(And(even, low), ClearBits(odd, low));
}
inline Vec InOrder32(Vec v) {
    return v;
}
inline Vec InOrder64(Vec v) {
    return v;
}
inline Vec DoubleEach64(Vec half) {
    return _mm_unpacklo_epi64(half, half);
}
inline Vec ExtendLowS16(Vec words) {
    return _mm_unpacklo_epi16(words, _mm_srai_epi16(words, 15));
}
inline Vec ExtendHighS16(Vec words) {
    return _mm_unpackhi_epi16(words, _mm_srai_epi16(words, 15));
}
inline Vec MulHighU32(Vec a, Vec b) {
    const Vec even = _mm_mul_epu32(a, b);
    const Vec odd = _mm_mul_epu32(_mm_srli_epi64(a, 32), _mm_srli_epi64(b, 32));
    return Or(_mm_srli_epi64(even, 32), And(odd, Splat64(0xFFFFFFFF00000000)));
}
inline Floats AsFloats(Vec bits) {
    return _mm_castsi128_ps(bits);
}
inline Block FirstBlock(Vec v) {
    return v;
}
inline Vec SpreadOverBlocks32(const void* from) {
    int value;
    __builtin_memcpy(&value, from, sizeof value);
    return _mm_set1_epi32(value);
}
inline Block SumOfBlocks32(Vec v) {
    return v;
}
inline Vec RunningSums32(Block& total, Vec change) {
    total = _mm_add_epi32(total, change);
    return total;
}

inline Vec LoadWords64(const uint16_t* from) {
    int32_t both;
    __builtin_memcpy(&both, from, sizeof both);
    const Vec words = _mm_cvtsi32_si128(both);
    const Vec twice = _mm_unpacklo_epi16(words, words);
    return _mm_unpacklo_epi32(twice, twice);
}
inline void BlocksInOrder(Vec&, Vec&) {}
inline Doubles LowF64(Floats v) {
    return _mm_cvtps_pd(v);
}
inline Doubles HighF64(Floats v) {
    return _mm_cvtps_pd(_mm_movehl_ps(v, v));
}
inline Floats ToFloats(Doubles low, Doubles high) {
    return _mm_movelh_ps(_mm_cvtpd_ps(low), _mm_cvtpd_ps(high));
}
inline Vec TruncateF64(Doubles low, Doubles high) {
    return _mm_unpacklo_epi64(_mm_cvttpd_epi32(low), _mm_cvttpd_epi32(high));
}
inline Vec AsVec64(Doubles v) {
    return _mm_castpd_si128(v);
}
inline Doubles FlipSign64(Doubles v, Vec signs) {
    return _mm_xor_pd(v, _mm_castsi128_pd(signs));
}
inline Doubles SelectLessF64(Doubles a, Doubles b, Doubles yes, Doubles no) {
    const Doubles less = _mm_cmplt_pd(a, b);
    return _mm_or_pd(_mm_and_pd(less, yes), _mm_andnot_pd(less, no));
}

#endif

// Sums of neighbouring numbers of 32 bits: those of the one, block by block, then of the other.
inline Vec AddNeighbours32(Vec a, Vec b) {
#if defined(KYV_VECTOR_SET_AVX512)
    const Floats x = _mm512_castsi512_ps(a), y = _mm512_castsi512_ps(b);
    return Add32(_mm512_castps_si512(_mm512_shuffle_ps(x, y, _MM_SHUFFLE(2, 0, 2, 0))),
                 _mm512_castps_si512(_mm512_shuffle_ps(x, y, _MM_SHUFFLE(3, 1, 3, 1))));
#elif defined(KYV_VECTOR_SET_AVX2)
    const Floats x = _mm256_castsi256_ps(a), y = _mm256_castsi256_ps(b);
    return Add32(_mm256_castps_si256(_mm256_shuffle_ps(x, y, _MM_SHUFFLE(2, 0, 2, 0))),
                 _mm256_castps_si256(_mm256_shuffle_ps(x, y, _MM_SHUFFLE(3, 1, 3, 1))));
#else
    const Floats x = _mm_castsi128_ps(a), y = _mm_castsi128_ps(b);
    return Add32(_mm_castps_si128(_mm_shuffle_ps(x, y, _MM_SHUFFLE(2, 0, 2, 0))),
                 _mm_castps_si128(_mm_shuffle_ps(x, y, _MM_SHUFFLE(3, 1, 3, 1))));
#endif
}
inline Doubles NegateF64(Doubles v) {
    return FlipSign64(v, Splat64(uint64_t{1} << 63));
}
inline void Prefetch(const void* at) {
    _mm_prefetch(static_cast<const char*>(at), _MM_HINT_T0);
}

inline Block LoadBlock(const void* from) {
    return _mm_loadu_si128(static_cast<const __m128i*>(from));
}
// Eight bytes from one place, then eight from another.
inline Block LoadHalves(const void* first, const void* second) {
    return _mm_unpacklo_epi64(_mm_loadl_epi64(static_cast<const __m128i*>(first)),
                              _mm_loadl_epi64(static_cast<const __m128i*>(second)));
}
// Four bytes from one place, four from another, and so once more.
inline Block LoadInTurns32(const void* first, const void* second) {
    return _mm_unpacklo_epi32(_mm_loadl_epi64(static_cast<const __m128i*>(first)),
                              _mm_loadl_epi64(static_cast<const __m128i*>(second)));
}
// Four words as 32 bits.
inline Block LoadBlockWords32(const uint16_t* from) {
    return _mm_unpacklo_epi16(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from)),
                              _mm_setzero_si128());
}
inline Block AddBlocks32(Block a, Block b) {
    return _mm_add_epi32(a, b);
}
inline Block SubBlocks32(Block a, Block b) {
    return _mm_sub_epi32(a, b);
}
// The first block's four numbers as the bytes of a pixel, saturated.
inline void StorePixel32(uint8_t* to, Vec v) {
    const Block words = _mm_packs_epi32(FirstBlock(v), _mm_setzero_si128());
    const int pixel = _mm_cvtsi128_si32(_mm_packus_epi16(words, words));
    __builtin_memcpy(to, &pixel, sizeof pixel);
}
// Sixteen bytes, the same in every block.
inline Vec RepeatBytes(const int8_t (&bytes)[16]) {
    return Repeat(LoadBlock(bytes));
}

#if !defined(KYV_VECTOR_SET_SSE2)
// The alpha of every pixel, in both of its words.
inline Vec AlphaWords(Vec pixels) {
    return ShuffleBytes(pixels,
                        RepeatBytes({3, -1, 3, -1, 7, -1, 7, -1, 11, -1, 11, -1, 15, -1, 15, -1}));
}
// The words of each block's first half, each followed by one of the second half.
inline Vec InterleaveHalves16(Vec v) {
    return ShuffleBytes(v, RepeatBytes({0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15}));
}
// A pixel's high word, which is below 256, in its first three bytes; the last is 0.
inline Vec SpreadHighWords(Vec v) {
    return ShuffleBytes(v, RepeatBytes({2, 2, 2, -1, 6, 6, 6, -1, 10, 10, 10, -1, 14, 14, 14, -1}));
}
// The low byte of a pixel's high word as its second byte; the rest is 0.
inline Vec SecondBytes(Vec v) {
    return ShuffleBytes(
        v, RepeatBytes({-1, 2, -1, -1, -1, 6, -1, -1, -1, 10, -1, -1, -1, 14, -1, -1}));
}
#endif

#undef KYV_UNARY
#undef KYV_BINARY
#undef KYV_SHIFT

} // namespace
} // namespace kyv::KYV_VECTOR_SET
