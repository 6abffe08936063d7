// Keeping highlights.
#include "effects/style/HighlightRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {

void HighlightRow(uint8_t* dst, const uint8_t* src, size_t count, const Highlight& highlight) {
    const Vec floor = Splat32(highlight.floor);
    const Vec slope = Splat32(highlight.slope);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec pixels = Load(src + i * 4);
        const Words words = Widen(pixels);
        // All in doublewords whose upper halves stay 0.
        const Vec above = SubSatU16(AverageU16(Luma(words), Strongest(pixels)), floor);
        const Vec rise = ShiftRight16<4>(MulLow16(above, slope));
        const Vec weight = MinS16(rise, Splat32(255));
        const Vec t = Add32(MulLow16(weight, weight), Splat32(128));
        const Vec square = ShiftRight32<8>(Add32(t, ShiftRight32<8>(t)));
        const Words weights = Spread(square);
        const Vec result =
            PackU16(Product(words.low, weights.low), Product(words.high, weights.high));
        Store(dst + i * 4, And(result, Splat32(0x00FFFFFF)));
    }
    HighlightRow_scalar(dst + i * 4, src + i * 4, count - i, highlight);
}

} // namespace kyv::KYV_VECTOR_SET
