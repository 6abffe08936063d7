// Mixing by a mask.
#include "effects/style/MaskMixRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {

void MaskMixRow(uint8_t* dst, const uint8_t* src, const uint8_t* effect, const uint8_t* weights,
                size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec bytes = LoadBytes32(weights + i);
        const Words weight = Spread(Add32(bytes, ShiftRight32<7>(bytes)));
        const Words a = Widen(Load(src + i * 4));
        const Words b = Widen(Load(effect + i * 4));
        Store(dst + i * 4,
              PackU16(Mix(a.low, b.low, weight.low), Mix(a.high, b.high, weight.high)));
    }
    MaskMixRow_scalar(dst + i * 4, src + i * 4, effect + i * 4, weights + i, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
