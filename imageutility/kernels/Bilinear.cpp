// Bilinear resizing: the definitions and the tables of forms.
#include "imageutility/kernels/Bilinear.h"

namespace kyv {
namespace {

// Between a and b for every fraction, so nothing is left to clamp. The product fits in 16 bits:
// 255 * 127 = 32385.
uint8_t Lerp(int32_t a, int32_t b, int32_t fraction) {
    return static_cast<uint8_t>(a + (((b - a) * fraction) >> 7));
}

} // namespace

void Bilinear_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                     const BilinearColumns& columns) {
    for (size_t i = 0; i < count; ++i, dst += 4) {
        const uint8_t* left = src + static_cast<ptrdiff_t>(columns.left[i]) * 4;
        const int32_t fraction = columns.weights[2 * i + 1];
        for (int c = 0; c < 4; ++c) {
            dst[c] = Lerp(left[c], left[c + 4], fraction);
        }
    }
}

void Lerp_scalar(uint8_t* dst, const uint8_t* upper, const uint8_t* lower, size_t count,
                 uint32_t fraction) {
    for (size_t i = 0; i < 4 * count; ++i) {
        dst[i] = Lerp(upper[i], lower[i], static_cast<int32_t>(fraction));
    }
}

constinit const KernelTable<BilinearRow> kBilinear = {KYV_TABLE(Bilinear)};

constinit const KernelTable<LerpRow> kLerp = {KYV_TABLE(Lerp)};

} // namespace kyv
