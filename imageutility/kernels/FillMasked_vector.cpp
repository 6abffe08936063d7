// Masked fill.
#include "imageutility/kernels/FillMasked.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {

void FillMasked(uint8_t* pixels, size_t count, uint32_t keep, uint32_t value) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        Store(pixels + i * 4, Or(And(Load(pixels + i * 4), Splat32(keep)), Splat32(value)));
    }
    FillMasked_scalar(pixels + i * 4, count - i, keep, value);
}

} // namespace kyv::KYV_VECTOR_SET
