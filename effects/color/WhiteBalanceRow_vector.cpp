// White balance.
#include "effects/color/WhiteBalanceRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// A byte for each byte of a pixel.
inline Vec PixelBytes(const uint8_t (&bytes)[4]) {
    uint32_t pixel;
    __builtin_memcpy(&pixel, bytes, sizeof pixel);
    return Splat32(pixel);
}

} // namespace

void WhiteBalanceRow(uint8_t* dst, const uint8_t* src, size_t count, const KneeCurves& curves) {
    size_t i = 0;
    if (curves.exact) {
        const Vec knee = PixelBytes(curves.knee);
        const Vec base = PixelBytes(curves.base);
        const Vec whole = PixelWords(curves.whole);
        const Vec fraction = PixelWords(curves.fraction);
        const Vec slope = PixelWords(curves.slope);
        // In words: how far each value goes up to the knee, and how far beyond.
        const auto rise = [&](Vec upTo, Vec beyond) {
            return Add16(Add16(MulLow16(upTo, whole), MulHighU16(upTo, fraction)),
                         MulHighU16(beyond, slope));
        };
        for (; i + kPixels <= count; i += kPixels) {
            const Vec bgra = Load(src + i * 4);
            const Vec upTo = MinU8(bgra, knee);
            const Vec beyond = SubSatU8(bgra, knee);
            const Vec low = rise(WidenLow8(upTo), WidenLow8(beyond));
            const Vec high = rise(WidenHigh8(upTo), WidenHigh8(beyond));
            Store(dst + i * 4, Add8(PackU16(low, high), base));
        }
    }
    WhiteBalanceRow_scalar(dst + i * 4, src + i * 4, count - i, curves);
}

} // namespace kyv::KYV_VECTOR_SET
