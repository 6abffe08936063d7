// ARGB to AYUV: the definition and the table of forms.
#include "imageutility/kernels/ToAYUV.h"

#include "imageutility/kernels/ColorMath.h"

namespace kyv {

void ToAYUV_scalar(uint8_t* dst, const uint8_t* src, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const YuvTriple yuv = YuvOf(src[2], src[1], src[0]);
        const uint8_t alpha = src[3];
        dst[0] = static_cast<uint8_t>(yuv.v);
        dst[1] = static_cast<uint8_t>(yuv.u);
        dst[2] = static_cast<uint8_t>(yuv.y);
        dst[3] = alpha;
    }
}

constinit const KernelTable<ToAYUVRow> kToAYUV = {KYV_TABLE(ToAYUV),
                                                  .passedOver = kNoneIsPassedOver};

} // namespace kyv
