// ARGB to AYUV.
#include "imageutility/kernels/ToAYUV.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// All sums are kept sixteenfold, so that a result is the high word of its sum. 16 x 2064 would not
// fit 16 bits; green is doubled instead. The constants ride on a word of 1024 beside it.
inline Vec Weigh(Vec br, Vec gc, Vec brFactors, Vec gcFactors) {
    return Add32(MulAddPairs16(br, brFactors), MulAddPairs16(gc, gcFactors));
}

inline Vec Convert(Vec bgra) {
    const Vec br = And(bgra, Splat32(0x00FF00FF));
    const Vec gc = Or(And(ShiftRight32<7>(bgra), Splat32(0x1FE)), Splat32(1024 << 16));
    const Vec y = Weigh(br, gc, PairOfWords(16 * 401, 16 * 1053), PairOfWords(8 * 2064, 1056));
    const Vec u = Weigh(br, gc, PairOfWords(16 * 1798, 16 * -606), PairOfWords(8 * -1192, 8224));
    const Vec v = Weigh(br, gc, PairOfWords(16 * -291, 16 * 1798), PairOfWords(8 * -1507, 8224));
    if constexpr (kHasMixWords) {
        const Vec vu = MixWords(ShiftRight32<16>(v), u);
        const Vec ya = MixWords(ShiftRight32<16>(y), ShiftRight16<8>(bgra));
        return InterleaveHalves16(PackU16(vu, ya));
    }
    const Vec vu = Or(ShiftRight32<16>(v), SecondBytes(u));
    return Or(vu, Or(And(y, Splat32(0x00FF0000)), And(bgra, Splat32(0xFF000000))));
}

} // namespace

void ToAYUV(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        Store(dst + i * 4, Convert(Load(src + i * 4)));
    }
    ToAYUV_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
