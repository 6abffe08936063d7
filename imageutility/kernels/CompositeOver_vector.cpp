// Straight-alpha "over".
#include "imageutility/kernels/CompositeOver.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// The quotient, below 256, of a numerator below 2^17 and a divisor up to 255. A half more keeps it
// 1/510 away from the next integers, and single precision errs by less than 1/32768.
inline Vec Divide(Vec numerator, Floats reciprocal) {
    return TruncateF32(MulF32(AddF32(F32FromS32(numerator), SplatF32(0.5F)), reciprocal));
}

// Both alphas, 32 bits each, not 0.
inline Vec Mix(Vec s, Vec d, Vec a, Vec under) {
    const Vec lowBytes = Splat16(0x00FF);
    const Vec lowWords = Splat32(0xFFFF);
    // x / 255 is (x * 0x8081) >> 23 for 16 bits.
    const Vec quotient = ShiftRight16<7>(MulHighU16(MulLow16(a, under), Splat32(0x8081)));
    const Vec out = Sub32(Add32(a, under), quotient);
    // Terms of 16 bits: blue and red together, then green beside zero.
    const Vec wOver = TwiceLow16(a);
    const Vec wUnder = Sub16(Splat16(256), wOver);
    const Vec underHigh = ShiftLeft16<8>(TwiceLow16(under));
    const Vec over = MulLow16(And(s, lowBytes), wOver);
    const Vec below = MulHighU16(MulLow16(And(d, lowBytes), wUnder), underHigh);
    const Vec sGreen = And(ShiftRight16<8>(s), lowWords);
    const Vec dGreen = And(ShiftRight16<8>(d), lowWords);
    const Vec green =
        Add32(MulLow16(sGreen, wOver), MulHighU16(MulLow16(dGreen, wUnder), underHigh));
    const Vec blue = Add32(And(over, lowWords), And(below, lowWords));
    const Vec red = Add32(ShiftRight32<16>(over), ShiftRight32<16>(below));
    // No quotient is above 255, so nothing is left to clamp.
    const Floats reciprocal = DivF32(SplatF32(1.0F), F32FromS32(out));
    const Vec bg = Or(Divide(blue, reciprocal), ShiftLeft32<8>(Divide(green, reciprocal)));
    const Vec ra = Or(Divide(red, reciprocal), ShiftLeft32<8>(out));
    return Or(bg, ShiftLeft32<16>(ra));
}

// Over opaque pixels, as those of most frames are, the sum is divided by 255. It grows with a, up
// to 255 * 255 + ((255 * 255) >> 8) = 65279, so words hold it. For an a of 0 and 255 it gives the
// pixel below and the one above, so nothing has to be chosen.
inline Vec MixHalfOverOpaque(Vec s, Vec d, Vec a) {
    const Vec below = MulHighU16(MulLow16(d, Sub16(Splat16(256), a)), Splat16(255 << 8));
    const Vec sum = Add16(MulLow16(s, a), below);
    return ShiftRight16<7>(MulHighU16(sum, Splat16(0x8081)));
}

inline Vec MixOverOpaque(Vec s, Vec d, Vec a) {
    const Vec both = TwiceLow16(a);
    return Or(PackU16(MixHalfOverOpaque(WidenLow8(s), WidenLow8(d), DoubleLow32(both)),
                      MixHalfOverOpaque(WidenHigh8(s), WidenHigh8(d), DoubleHigh32(both))),
              Splat32(0xFF000000));
}

} // namespace

void CompositeOver(uint8_t* dst, const uint8_t* src, size_t count, uint8_t opacity) {
    const Vec factor = Splat32(opacity + 1U);
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const Vec s = Load(src + i * 4);
        const Vec a = ShiftRight32<8>(MulLow16(ShiftRight32<24>(s), factor));
        const Vec keeps = Equal32(a, Zero());
        // Sprites have wide clear and opaque areas.
        if (AllSet(keeps)) {
            continue;
        }
        const Vec d = Load(dst + i * 4);
        const Vec under = ShiftRight32<24>(d);
        if (AllSet(Equal32(under, Splat32(255)))) {
            Store(dst + i * 4, MixOverOpaque(s, d, a));
            continue;
        }
        const Vec copies = Or(Equal32(a, Splat32(255)), Equal32(under, Zero()));
        Vec result = Or(And(s, Splat32(0x00FFFFFF)), ShiftLeft32<24>(a));
        if (!AllSet(Or(keeps, copies))) {
            result = Select(copies, result, Mix(s, d, a, under));
        }
        Store(dst + i * 4, Select(keeps, d, result));
    }
    CompositeOver_scalar(dst + i * 4, src + i * 4, count - i, opacity);
}

} // namespace kyv::KYV_VECTOR_SET
