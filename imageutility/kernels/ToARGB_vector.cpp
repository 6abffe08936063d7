// AYUV to ARGB.
#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/Vector.h"

namespace kyv::KYV_VECTOR_SET {
namespace {

struct Channels {
    Vec b, g, r; // 4096 times a channel, not clamped
    Vec ua;      // words: U and alpha
};

inline Channels Convert(Vec vuya) {
    const Vec vy = And(vuya, Splat32(0x00FF00FF));
    const Vec ua = ShiftRight16<8>(vuya);
    // The offsets of Y, U and V and the rounding half together are multiples of 64, and ride on a
    // word of 64 beside U where they can.
    const Vec uc = MixWords(ua, Splat16(64));
    return {.b = Add32(MulAddPairs16(vy, PairOfWords(0, 4768)),
                       MulAddPairs16(uc, PairOfWords(8266, -17692))),
            .g = Add32(MulAddPairs16(vy, PairOfWords(-3330, 4768)),
                       MulAddPairs16(uc, PairOfWords(-1602, 8704))),
            .r = Add32(MulAddPairs16(vy, PairOfWords(6537, 4768)),
                       Splat32(static_cast<uint32_t>(64 * -14234))),
            .ua = ua};
}

[[maybe_unused]] inline Vec PackTwo(Vec first, Vec second) {
    return PackS32(ShiftRightS32<12>(first), ShiftRightS32<12>(second));
}

} // namespace

void ToARGB(uint8_t* dst, const uint8_t* src, size_t count) {
    size_t i = 0;
    if constexpr (kHasMixWords) {
        for (; i + kPixels <= count; i += kPixels) {
            const Channels p = Convert(Load(src + i * 4));
            // Signed words, clamped when they are packed: B and G, then R and A.
            const Vec bg = MixWords(ShiftRight32<12>(p.b), ShiftLeft32<4>(p.g));
            const Vec ra = MixWords(ShiftRight32<12>(p.r), p.ua);
            Store(dst + i * 4, InterleaveHalves16(PackU16(bg, ra)));
        }
    } else {
        for (; i + 2 * kPixels <= count; i += 2 * kPixels) {
            const Channels p = Convert(Load(src + i * 4));
            const Channels q = Convert(Load(src + i * 4 + kBytes));
            // Packing clamps: B and R of both, then G and A.
            const Vec br = PackU16(PackTwo(p.b, q.b), PackTwo(p.r, q.r));
            const Vec ga =
                PackU16(PackTwo(p.g, q.g), PackS32(ShiftRight32<16>(p.ua), ShiftRight32<16>(q.ua)));
            const Vec bg = InterleaveLow8(br, ga);
            const Vec ra = InterleaveHigh8(br, ga);
            Store(dst + i * 4, InterleaveLow16(bg, ra));
            Store(dst + i * 4 + kBytes, InterleaveHigh16(bg, ra));
        }
    }
    ToARGB_scalar(dst + i * 4, src + i * 4, count - i);
}

} // namespace kyv::KYV_VECTOR_SET
