// Softness and glow.
#include "effects/style/DreamyRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// DreamyMix in every word.
struct Mixes {
    Vec soft;
    Vec glow;
    Vec depth;
};

// Of words 0..255: the source, the softened picture, the glow and the source's luma.
inline Vec Blend(Vec src, Vec soft, Vec glow, Vec luma, const Mixes& mix) {
    const Vec rise = ShiftRight16<2>(MulLow16(luma, Splat16(3)));
    const Vec softWeight = ShiftRight16<8>(MulLow16(mix.soft, Add16(Splat16(64), rise)));
    const Vec gain = ShiftRight16<5>(MulLow16(luma, Splat16(13)));
    const Vec glowWeight = ShiftRight16<8>(MulLow16(mix.glow, Add16(Splat16(152), gain)));
    const Vec base = Mix(src, soft, softWeight);
    const Vec rich = Mix(base, Product(base, base), mix.depth);
    const Vec dim = Product(Invert(glow), Invert(glow));
    const Vec light = Scale(Invert(Product(dim, dim)), glowWeight);
    return Invert(Product(Invert(rich), Invert(light)));
}

} // namespace

void DreamyRow(uint8_t* dst, const uint8_t* src, const uint8_t* soft, const uint8_t* glow,
               size_t count, const DreamyMix& mix) {
    const Mixes mixes = {Splat16(mix.soft), Splat16(mix.glow), Splat16(mix.depth)};
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec pixels = Load(src + i * 4);
        const Vec softened = Load(soft + i * 4);
        const Vec held = AverageU8(pixels, AverageU8(pixels, softened));
        const Words s = Widen(pixels);
        const Words m = Widen(MaxU8(softened, held));
        const Words g = Widen(Load(glow + i * 4));
        const Words luma = Spread(Luma(s));
        const Vec low = Blend(s.low, m.low, g.low, luma.low, mixes);
        const Vec high = Blend(s.high, m.high, g.high, luma.high, mixes);
        Store(dst + i * 4, WithAlphaOf(pixels, PackU16(low, high)));
    }
    DreamyRow_scalar(dst + i * 4, src + i * 4, soft + i * 4, glow + i * 4, count - i, mix);
}

} // namespace kyv::KYV_VECTOR_SET
