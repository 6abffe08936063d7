// Straight-alpha "over": the definition and the table of forms.
#include "imageutility/kernels/CompositeOver.h"

#include "imageutility/kernels/BlendMath.h"

namespace kyv {

void CompositeOver_scalar(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const uint32_t a = BlendWeight(src[3], opacity);
        if (a == 0) {
            continue;
        }
        const uint32_t under = dst[3];
        if (a == 255 || under == 0) {
            dst[0] = src[0];
            dst[1] = src[1];
            dst[2] = src[2];
            dst[3] = static_cast<uint8_t>(a);
            continue;
        }
        // Never below a, so the divisor is not 0, and never above 255.
        const uint32_t out = a + under - a * under / 255;
        // Weights of a / 255 and (256 - a) / 256, each cut off: white over white may come out as
        // dark as 247 (alpha 10 over 24). Intended.
        for (int c = 0; c < 3; ++c) {
            const uint32_t sum = src[c] * a + ((dst[c] * (256 - a) * under) >> 8);
            const uint32_t value = sum / out;
            dst[c] = static_cast<uint8_t>(value > 255 ? 255 : value);
        }
        dst[3] = static_cast<uint8_t>(out);
    }
}

constinit const KernelTable<CompositeOverRow> kCompositeOver = {KYV_TABLE(CompositeOver)};

} // namespace kyv
