// Contrast: the definition and the table of forms.
#include "imageutility/kernels/Contrast.h"

#include "imageutility/kernels/ColorMath.h"

namespace kyv {

void Contrast_scalar(uint8_t* pixels, size_t count, int32_t factor) {
    for (size_t i = 0; i < count; ++i, pixels += 4) {
        // Halves go up on both sides of 128: at 1.5, 129 becomes 130 and 127 stays. Intended.
        for (int c = 0; c < 3; ++c) {
            pixels[c] = ClampByte((((pixels[c] - 128) * factor + 2048) >> 12) + 128);
        }
    }
}

constinit const KernelTable<ContrastRow> kContrast = {KYV_TABLE(Contrast)};

} // namespace kyv
