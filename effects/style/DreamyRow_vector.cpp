// The dreamy veil and mix.
#include "effects/style/DreamyRow.h"
#include "effects/style/StyleVector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// DreamyMix in every word.
struct Mixes {
    Vec rest; // what is left beside the softened picture
    Vec glow;
};

// The strongest of each pixel's channels, for all of them.
inline Words SpreadStrongest(Vec pixels) {
    return Spread(Strongest(pixels));
}

// Of words 0..255, a pixel's strongest channels, and what is kept of it after deepening: what the
// row takes on, and in the words of alpha the share that it keeps.
inline Vec Veil(Vec soft, Vec strongestSoft, Vec glow, Vec strongestGlow, Vec kept,
                const Mixes& mix) {
    const Vec share = ShiftRight16<8>(Add16(MulLow16(kept, mix.rest), Splat16(128)));
    const Vec dim = Invert(strongestGlow);
    const Vec gain = Add16(Product(dim, dim), Splat16(128));
    const Vec light = Scale(ShiftRight16<7>(MulLow16(glow, gain)), mix.glow);
    const Vec base = ShiftRight16<8>(MulLow16(soft, kept));
    const Vec strongest = ShiftRight16<8>(MulLow16(strongestSoft, kept));
    const Vec room = Invert(AverageU16(base, strongest));
    const Vec flat = Add16(base, Product(light, room));
    const Vec own = ShiftRight16<8>(MulLow16(soft, share));
    return Select(PixelWords(0, 0, 0, 0xFFFF), share, SubSatU16(flat, own));
}

} // namespace

void DreamyVeilRow(uint8_t* dst, const uint8_t* soft, const uint8_t* glow, size_t count,
                   const DreamyMix& mix) {
    const Mixes mixes = {Splat16(static_cast<uint16_t>(256 - mix.soft)), Splat16(mix.glow)};
    const Vec depth = Splat16(mix.depth);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec softened = Load(soft + i * 4);
        const Vec lights = Load(glow + i * 4);
        const Words s = Widen(softened);
        const Words g = Widen(lights);
        const Words luma = Spread(Luma(s));
        const Words most = SpreadStrongest(softened);
        const Words brightest = SpreadStrongest(lights);
        const Vec low = Sub16(Splat16(256), Scale(Invert(luma.low), depth));
        const Vec high = Sub16(Splat16(256), Scale(Invert(luma.high), depth));
        Store(dst + i * 4, PackU16(Veil(s.low, most.low, g.low, brightest.low, low, mixes),
                                   Veil(s.high, most.high, g.high, brightest.high, high, mixes)));
    }
    DreamyVeilRow_scalar(dst + i * 4, soft + i * 4, glow + i * 4, count - i, mix);
}

void DreamyRow(uint8_t* dst, const uint8_t* src, const uint8_t* veil, size_t count) {
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec pixels = Load(src + i * 4);
        const Vec over = Load(veil + i * 4);
        const Words shares = Spread(Add32(ShiftRight32<24>(over), Splat32(1)));
        const Words own = Widen(pixels);
        const Vec kept = PackU16(ShiftRight16<8>(MulLow16(own.low, shares.low)),
                                 ShiftRight16<8>(MulLow16(own.high, shares.high)));
        const Words strongest = SpreadStrongest(pixels);
        const Vec all = PackU16(strongest.low, strongest.high);
        const Words taken = Widen(AddSatU8(AddSatU8(all, all), Splat8(kShadowTakes)));
        const Words more = Widen(over);
        const Vec sum =
            AddSatU8(kept, PackU16(Product(more.low, taken.low), Product(more.high, taken.high)));
        Store(dst + i * 4, WithAlphaOf(pixels, sum));
    }
    DreamyRow_scalar(dst + i * 4, src + i * 4, veil + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
