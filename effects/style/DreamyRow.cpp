// The definition of the dreamy veil and mix.
#include "effects/style/DreamyRow.h"

#include <algorithm>

#include "effects/style/StyleMath.h"

namespace kyv {

void DreamyVeilRow_scalar(uint8_t* dst, const uint8_t* soft, const uint8_t* glow, size_t count,
                          const DreamyMix& mix) {
    for (size_t i = 0; i < count; ++i, dst += 4, soft += 4, glow += 4) {
        // Deep tones are deepened, which holds the contrast under the glow's veil.
        const uint32_t luma = StyleLuma(soft[0], soft[1], soft[2]);
        const uint32_t kept = 256 - (((255 - luma) * mix.depth + 128) >> 8);
        const uint32_t share = (kept * (256 - mix.soft) + 128) >> 8;
        const uint32_t strongest = (std::max({soft[0], soft[1], soft[2]}) * kept) >> 8;
        // x + 2 x (1 - x)^2 of the strongest channel never falls: strong glow does not clip.
        const uint32_t dim = 255U - std::max({glow[0], glow[1], glow[2]});
        const uint32_t gain = 128 + StyleProduct(dim, dim);
        for (int c = 0; c < 3; ++c) {
            const uint32_t light = (((glow[c] * gain) >> 7) * mix.glow + 128) >> 8;
            const uint32_t base = (soft[c] * kept) >> 8;
            const uint32_t room = 255 - ((base + strongest + 1) >> 1);
            const uint32_t flat = base + StyleProduct(light, room);
            const uint32_t own = (soft[c] * share) >> 8;
            dst[c] = static_cast<uint8_t>(flat - std::min(own, flat));
        }
        dst[3] = static_cast<uint8_t>(std::min(share, 255U));
    }
}

void DreamyRow_scalar(uint8_t* dst, const uint8_t* src, const uint8_t* veil, size_t count) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4, veil += 4) {
        const uint32_t strongest = std::max({src[0], src[1], src[2]});
        const uint32_t taken = std::min(strongest * kShadowTakesPerLevel + kShadowTakes, 255U);
        for (int c = 0; c < 3; ++c) {
            const uint32_t own = (src[c] * (veil[3] + 1U)) >> 8;
            dst[c] = static_cast<uint8_t>(std::min(own + StyleProduct(veil[c], taken), 255U));
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<DreamyVeilRow> kDreamyVeilRow = {KYV_TABLE(DreamyVeilRow)};
constinit const KernelTable<DreamyRow> kDreamyRow = {KYV_TABLE(DreamyRow),
                                                     .passedOver = kNoneIsPassedOver};

} // namespace kyv
