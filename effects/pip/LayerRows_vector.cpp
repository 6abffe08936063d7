// Layer passes.
#include "effects/pip/LayerRows.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// All ones in pixels without alpha.
inline Vec Uncovered(Vec pixels) {
    return Equal32(ShiftRight32<24>(pixels), Zero());
}

// -1 in pixels that match. The tolerance has 255 for alpha.
inline Vec Matches(Vec pixels, Vec key, Vec tolerance) {
    const Vec distance = Or(SubSatU8(pixels, key), SubSatU8(key, pixels));
    return Equal32(SubSatU8(distance, tolerance), Zero());
}

} // namespace

void ColorKeyRow(uint8_t* pixels, const uint8_t* below, size_t count, uint32_t key,
                 uint8_t tolerance) {
    const Vec keys = Splat32(key);
    const Vec tolerances = Splat32(0xFF000000U | tolerance * 0x010101U);
    size_t i = 0;
    // Every step reads one pixel more than it writes.
    for (; i + kPixels + 1 <= count; i += kPixels) {
        const Vec here = Load(pixels + i * 4);
        const Vec matches = Add32(Add32(Matches(here, keys, tolerances),
                                        Matches(Load(pixels + i * 4 + 4), keys, tolerances)),
                                  Add32(Matches(Load(below + i * 4), keys, tolerances),
                                        Matches(Load(below + i * 4 + 4), keys, tolerances)));
        // 4 + matches pixels do not match; 64 each, in the top byte. All four are 255.
        const Vec number = Add32(matches, Splat32(4));
        const Vec all = Equal32(matches, Zero());
        const Vec alpha = ShiftLeft32<24>(Or(ShiftLeft32<6>(number), And(all, Splat32(255))));
        const Vec covered = ClearBits(Splat32(0xFF000000), Uncovered(here));
        Store(pixels + i * 4, Select(covered, alpha, here));
    }
    ColorKeyRow_scalar(pixels + i * 4, below + i * 4, count - i, key, tolerance);
}

void GradientRow(uint8_t* pixels, const float* top, const float* rise, size_t count, float part) {
    const Floats parts = SplatF32(part);
    const auto blend = [&](size_t channel) {
        const Floats value = AddF32(LoadF32(top + channel), MulF32(LoadF32(rise + channel), parts));
        return TruncateF32(MaxF32(MinF32(value, SplatF32(255.0F)), SplatF32(0.0F)));
    };
    size_t i = 0;
    for (; i + kPixels <= count; i += kPixels) {
        const size_t first = i * 4;
        const Vec old = Load(pixels + first);
        const Vec keep = Or(Uncovered(old), Splat32(0xFF000000));
        const Vec low = PackS32(blend(first), blend(first + kPixels));
        const Vec high = PackS32(blend(first + 2 * kPixels), blend(first + 3 * kPixels));
        Store(pixels + first, Select(keep, old, InOrder32(PackU16(low, high))));
    }
    GradientRow_scalar(pixels + i * 4, top + i * 4, rise + i * 4, count - i, part);
}

} // namespace kyv::KYV_VECTOR_SET
