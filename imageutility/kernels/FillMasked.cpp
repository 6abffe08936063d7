// Masked fill: the definition and the table of forms.
#include "imageutility/kernels/FillMasked.h"

#include <cstring>

namespace kyv {

void FillMasked_scalar(uint8_t* pixels, size_t count, uint32_t keep, uint32_t value) {
    for (size_t i = 0; i < count; ++i, pixels += 4) {
        uint32_t pixel;
        std::memcpy(&pixel, pixels, sizeof pixel);
        pixel = (pixel & keep) | value;
        std::memcpy(pixels, &pixel, sizeof pixel);
    }
}

constinit const KernelTable<FillMaskedRow> kFillMasked = {KYV_TABLE(FillMasked)};

} // namespace kyv
