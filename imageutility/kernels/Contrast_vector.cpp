// Contrast.
#include "imageutility/kernels/Contrast.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {

void Contrast(uint8_t* pixels, size_t count, int32_t factor) {
    // A factor of 1 keeps alpha.
    const Vec factors = PixelWords(factor, factor, factor, 4096);
    const Vec center = Splat8(0x80);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec x = Xor(Load(pixels + i * 4), center);
        // x - 128 in 1/256 times factors in 1/4096.
        const Vec low = MulRound20(InterleaveLow8(Zero(), x), factors);
        const Vec high = MulRound20(InterleaveHigh8(Zero(), x), factors);
        Store(pixels + i * 4, Xor(PackS16(low, high), center));
    }
    Contrast_scalar(pixels + i * 4, count - i, factor);
}

} // namespace kyv::KYV_VECTOR_SET
