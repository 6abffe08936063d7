// Mask blend.
#include "effects/transition/MaskBlendRow.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

// The factors of half the pixels, in the order that interleaving gives them: of every four from the
// first on, the first two.
inline Vec Lookup(const uint16_t (*table)[4], const uint8_t* mask) {
    return FromBlocks(
        [&](size_t k) { return LoadHalves(table[mask[4 * k]], table[mask[4 * k + 1]]); });
}

// Pixels in 16-bit lanes. p1 * w + p0 * (255 - w) is at most 255 * 255, so
// 256 * p0 + (p1 - p0) * w - p0 is right in 16 bits whatever overflows on the way; without the
// last term a weight of 0 or 256 gives p0 or p1. *isMixed is set in the lanes of other weights.
inline Vec Mix(Vec p0, Vec p1, Vec w, Vec* isMixed) {
    const Vec isPure = Equal16(And(w, Splat16(0x00FF)), Zero());
    *isMixed = Xor(isPure, Splat16(0xFFFF));
    const Vec sum = Add16(ShiftLeft16<8>(p0), MulLow16(Sub16(p1, p0), w));
    return ShiftRight16<8>(Sub16(sum, ClearBits(p0, isPure)));
}

// At most 255 * 256 + 0 or 255 * 255: 16 bits hold it.
inline Vec Tint(Vec x, Vec keep, Vec edge) {
    return ShiftRight16<8>(Add16(MulLow16(x, keep), edge));
}

inline void BlendPixels(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                        const uint8_t* mask, const MaskBlend& blend) {
    const Vec p0 = Load(picture0);
    const Vec p1 = Load(picture1);
    Vec isMixedLow, isMixedHigh;
    Vec low = Mix(WidenLow8(p0), WidenLow8(p1), Lookup(blend.weight, mask), &isMixedLow);
    Vec high = Mix(WidenHigh8(p0), WidenHigh8(p1), Lookup(blend.weight, mask + 2), &isMixedHigh);
    if (blend.hasEdge) {
        low = Tint(low, Lookup(blend.keep, mask), Lookup(blend.edge, mask));
        high = Tint(high, Lookup(blend.keep, mask + 2), Lookup(blend.edge, mask + 2));
    }
    const Vec alphas = And(PackS16(isMixedLow, isMixedHigh), Splat32(0xFF000000));
    Store(dst, Select(alphas, MaxU8(p0, p1), PackU16(low, high)));
}

inline void CopyPixels(uint8_t* dst, const uint8_t* src) {
    for (size_t i = 0; i < 4 * kBytes; i += kBytes) {
        Store(dst + i, Load(src + i));
    }
}

} // namespace

void MaskBlendRow(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                  const uint8_t* mask, size_t count, const MaskBlend& blend) {
    // Bounds that no byte reaches are compared as 255 or 0 and then not counted.
    const bool allow0 = blend.picture0From <= 255;
    const bool allow1 = blend.picture1UpTo >= 0;
    const Vec from = Splat8(static_cast<uint32_t>(allow0 ? blend.picture0From : 255));
    const Vec upTo = Splat8(static_cast<uint32_t>(allow1 ? blend.picture1UpTo : 0));
    size_t i = 0;
    for (; i + kBytes <= count; i += kBytes) {
        const Vec m = Load(mask + i);
        const size_t at = i * 4;
        if (allow0 && AllSet(Equal8(MaxU8(m, from), m))) {
            CopyPixels(dst + at, picture0 + at);
        } else if (allow1 && AllSet(Equal8(MinU8(m, upTo), m))) {
            CopyPixels(dst + at, picture1 + at);
        } else {
            for (size_t j = 0; j < kBytes; j += kPixels) {
                BlendPixels(dst + at + j * 4, picture0 + at + j * 4, picture1 + at + j * 4,
                            mask + i + j, blend);
            }
        }
    }
    MaskBlendRow_scalar(dst + i * 4, picture0 + i * 4, picture1 + i * 4, mask + i, count - i,
                        blend);
}

} // namespace kyv::KYV_VECTOR_SET
