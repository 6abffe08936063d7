// AYUV to ARGB: the definition and the table of forms.
#include "imageutility/kernels/ToARGB.h"

#include "imageutility/kernels/ColorMath.h"

namespace kyv {

void ToARGB_scalar(uint8_t* dst, const uint8_t* src, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        const RgbTriple rgb = RgbOf(src[2], src[1], src[0]);
        const uint8_t alpha = src[3];
        dst[0] = ClampByte(rgb.b);
        dst[1] = ClampByte(rgb.g);
        dst[2] = ClampByte(rgb.r);
        dst[3] = alpha;
    }
}

constinit const KernelTable<ToARGBRow> kToARGB = {KYV_TABLE(ToARGB),
                                                  .passedOver = kNoneIsPassedOver};

} // namespace kyv
