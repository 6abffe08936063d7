// Alpha blend.
#include "imageutility/kernels/AlphaBlend.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
// s * w + d * (256 - w) is at most 255 * 256, so (s - d) * w + 256 * d is right in 16 bits whatever
// overflows on the way.
inline Vec Blend(Vec s, Vec d, Vec opacity) {
    const Vec lowBytes = Splat16(0x00FF);
    const Vec w = ShiftRight16<8>(MulLow16(AlphaWords(s), opacity));
    const Vec dRedBlue = And(d, lowBytes);
    const Vec redBlue =
        Add16(MulLow16(Sub16(And(s, lowBytes), dRedBlue), w), ShiftLeft16<8>(dRedBlue));
    // A weight of 0 keeps alpha.
    const Vec wGreen = And(w, Splat32(0xFFFF));
    const Vec difference = Sub16(ShiftRight16<8>(s), ShiftRight16<8>(d));
    const Vec greenAlpha = Add16(MulLow16(difference, wGreen), ClearBits(d, lowBytes));
    return Or(ShiftRight16<8>(redBlue), ClearBits(greenAlpha, lowBytes));
}

} // namespace

void AlphaBlend(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const Vec factor = Splat16(opacity + 1U);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        Store(dst + i * 4, Blend(Load(src + i * 4), Load(dst + i * 4), factor));
    }
    AlphaBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv::KYV_VECTOR_SET
