// Screen.
#include "imageutility/kernels/ScreenBlend.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline Vec Screen(Vec s, Vec d) {
    const Vec colors = Splat32(0x00FFFFFF);
    const Vec lowBytes = Splat16(0x00FF);
    const Vec u = Xor(s, colors);
    const Vec v = Xor(d, colors);
    const Vec redBlue = ShiftRight16<8>(MulLow16(And(u, lowBytes), And(v, lowBytes)));
    const Vec green = And(MulLow16(ShiftRight16<8>(u), ShiftRight16<8>(v)), Splat32(0xFF00));
    return Or(Xor(Or(redBlue, green), colors), ClearBits(d, colors));
}

} // namespace

void ScreenBlend(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        Store(dst + i * 4, Screen(Load(src + i * 4), Load(dst + i * 4)));
    }
    ScreenBlend_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
