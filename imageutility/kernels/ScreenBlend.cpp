// Screen: the definition and the table of forms.
#include "imageutility/kernels/ScreenBlend.h"

namespace kyv {

void ScreenBlend_scalar(uint8_t* dst, const uint8_t* src, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4) {
        for (int c = 0; c < 3; ++c) {
            // The shift in place of a division by 255 lifts black on black to 1. Intended.
            dst[c] = static_cast<uint8_t>(255 - (((255 - src[c]) * (255 - dst[c])) >> 8));
        }
    }
}

constinit const KernelTable<ScreenBlendRow> kScreenBlend = {KYV_TABLE(ScreenBlend)};

} // namespace kyv
