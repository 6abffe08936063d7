// Luma, spread over a pixel or as bytes.
#include "imageutility/kernels/ToGray.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Sixteen times the luma of every pixel: it is the high word of each 32 bits. 16 x 2064 would not
// fit 16 bits; green is doubled instead. The constant rides on a word of 1024 beside it.
inline Vec Luma(Vec bgra) {
    const Vec br = And(bgra, Splat32(0x00FF00FF));
    const Vec gc = Or(And(ShiftRight32<7>(bgra), Splat32(0x1FE)), Splat32(1024 << 16));
    return Add32(MulAddPairs16(br, PairOfWords(16 * 401, 16 * 1053)),
                 MulAddPairs16(gc, PairOfWords(8 * 2064, 1056)));
}

inline Vec LumaWords(const uint8_t* pixels) {
    return PackS32(ShiftRight32<16>(Luma(Load(pixels))),
                   ShiftRight32<16>(Luma(Load(pixels + kBytes))));
}

} // namespace

void ToGray(uint8_t* pixels, size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec bgra = Load(pixels + i * 4);
        const Vec gray = SpreadHighWords(Luma(bgra));
        Store(pixels + i * 4, Or(gray, And(bgra, Splat32(0xFF000000))));
    }
    ToGray_scalar(pixels + i * 4, count - i);
}

void ToGrayBytes(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + kBytes <= count; i += kBytes) {
        const Vec low = LumaWords(src + i * 4);
        const Vec high = LumaWords(src + i * 4 + 2 * kBytes);
        Store(dst + i, InOrder32(PackU16(low, high)));
    }
    ToGrayBytes_scalar(dst + i, src + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
