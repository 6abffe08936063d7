// Luma: the definitions and the tables of forms.
#include "imageutility/kernels/ToGray.h"

#include "imageutility/kernels/ColorMath.h"

namespace kyv {

void ToGray_scalar(uint8_t* pixels, size_t count) {
    for (size_t i = 0; i < count; ++i, pixels += 4) {
        const auto luma = static_cast<uint8_t>(LumaOf(pixels[2], pixels[1], pixels[0]));
        pixels[0] = luma;
        pixels[1] = luma;
        pixels[2] = luma;
    }
}

void ToGrayBytes_scalar(uint8_t* dst, const uint8_t* src, size_t count) {
    for (size_t i = 0; i < count; ++i, src += 4) {
        dst[i] = static_cast<uint8_t>(LumaOf(src[2], src[1], src[0]));
    }
}

constinit const KernelTable<ToGrayRow> kToGray = {KYV_TABLE(ToGray)};

constinit const KernelTable<ToGrayBytesRow> kToGrayBytes = {KYV_TABLE(ToGrayBytes)};

} // namespace kyv
