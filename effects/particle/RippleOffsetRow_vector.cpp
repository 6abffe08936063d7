// A ripple's offsets.
#include "effects/particle/RippleOffsetRow.h"
#include "effects/particle/RippleSine.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

inline Doubles Sine(Doubles x) {
    using namespace ripple_sine;
    const Doubles rounder = SplatF64(kRounder);
    const Doubles rounded = AddF64(MulF64(x, SplatF64(kOneOverPi)), rounder);
    const Doubles n = SubF64(rounded, rounder);
    const Doubles high = SubF64(x, MulF64(n, SplatF64(kPiHigh)));
    const Doubles rest = SubF64(high, MulF64(n, SplatF64(kPiLow)));
    const Doubles square = MulF64(rest, rest);
    Doubles sum = SplatF64(kTerms[kTermCount - 1]);
    for (int i = kTermCount - 2; i >= 0; --i) {
        sum = AddF64(MulF64(sum, square), SplatF64(kTerms[i]));
    }
    const Doubles sine = AddF64(rest, MulF64(rest, MulF64(square, sum)));
    // The lowest bit of the rounded quotient becomes a sign.
    return FlipSign64(sine, ShiftLeft64<63>(AsVec64(rounded)));
}

} // namespace

void RippleOffsetRow(float* offsets, size_t count, int32_t dy, const RippleShape& shape) {
    const Floats radius = SplatF32(shape.radius);
    const Floats wavelength = SplatF32(shape.wavelength);
    const Floats amplitude = SplatF32(shape.amplitude);
    const Floats phase = SplatF32(shape.phase);
    const Floats turn = SplatF32(6.2831855F);
    const Vec dy2 = Splat32(static_cast<uint32_t>(dy * dy));
    float rest[kPixels];
    for (size_t i = 0; i < count; i += kPixels) {
        // Below 2^16, or the square would not fit; columns beyond the row's end are not written.
        const Vec dx = Add32(Splat32(static_cast<uint32_t>(i)), Ascending32());
        const Vec dx2 = Or(MulLow16(dx, dx), ShiftLeft32<16>(MulHighU16(dx, dx)));
        const Floats distance = SqrtF32(F32FromS32(Add32(dx2, dy2)));
        const Floats weight = MaxF32(SubF32(radius, distance), SplatF32(0.0F));
        const Floats angle = AddF32(MulF32(DivF32(distance, wavelength), turn), phase);
        const Floats sine = ToFloats(Sine(LowF64(angle)), Sine(HighF64(angle)));
        const Floats result = MulF32(MulF32(DivF32(weight, radius), amplitude), sine);
        if (i + kPixels <= count) {
            StoreF32(offsets + i, result);
            continue;
        }
        StoreF32(rest, result);
        for (size_t j = 0; i + j < count; ++j) {
            offsets[i + j] = rest[j];
        }
    }
}

} // namespace kyv::KYV_VECTOR_SET
