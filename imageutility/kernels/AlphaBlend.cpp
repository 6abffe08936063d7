// Alpha blend: the definition and the table of forms.
#include "imageutility/kernels/AlphaBlend.h"

#include "imageutility/kernels/BlendMath.h"

namespace kyv {

void AlphaBlend_scalar(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        // w is 0..255 but the weights sum to 256: white over black gives 254. Intended.
        const uint32_t w = BlendWeight(src[3], opacity);
        for (int c = 0; c < 3; ++c) {
            dst[c] = static_cast<uint8_t>((src[c] * w + dst[c] * (256 - w)) >> 8);
        }
    }
}

constinit const KernelTable<AlphaBlendRow> kAlphaBlend = {KYV_TABLE(AlphaBlend)};

} // namespace kyv
