// Saturating addition.
#include "imageutility/kernels/AddBlend.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// Blue and red lie in the low bytes of the 16-bit lanes, green and alpha in the high bytes.
inline Vec Add(Vec s, Vec d, Vec opacity) {
    const Vec lowBytes = Splat16(0x00FF);
    // 256 times the weight, so that the high half of a product is (s * w) >> 8.
    const Vec w = ClearBits(MulLow16(AlphaWords(s), opacity), lowBytes);
    const Vec redBlue = MulHighU16(And(s, lowBytes), w);
    // The source's alpha adds nothing.
    const Vec green = And(MulHighU16(And(s, Splat32(0xFF00)), w), Splat32(0xFF00));
    return AddSatU8(d, Or(redBlue, green));
}

} // namespace

void AddBlend(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const Vec factor = Splat16(opacity + 1U);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        Store(dst + i * 4, Add(Load(src + i * 4), Load(dst + i * 4), factor));
    }
    AddBlend_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv::KYV_VECTOR_SET
