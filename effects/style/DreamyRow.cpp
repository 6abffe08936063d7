// The definition of the dreamy mix.
#include "effects/style/DreamyRow.h"

#include <algorithm>

#include "effects/style/StyleMath.h"

namespace kyv {
namespace {

constexpr uint32_t Mean(uint32_t a, uint32_t b) {
    return (a + b + 1) >> 1;
}

} // namespace

void DreamyRow_scalar(uint8_t* dst, const uint8_t* src, const uint8_t* soft, const uint8_t* glow,
                      size_t count, const DreamyMix& mix) {
    for (size_t i = 0; i < count; ++i, dst += 4, src += 4, soft += 4, glow += 4) {
        // A quarter of the softness and more than half of the glow for black, nearly all for white,
        // so that dark detail stays crisp and blacks are not lifted by their surroundings.
        const uint32_t luma = StyleLuma(src[0], src[1], src[2]);
        const uint32_t softWeight = (mix.soft * (64 + ((luma * 3) >> 2))) >> 8;
        const uint32_t glowWeight = (mix.glow * (152 + ((luma * 13) >> 5))) >> 8;
        for (int c = 0; c < 3; ++c) {
            // Softening may brighten in full but darkens by a quarter only: lights stay lights.
            const uint32_t held = Mean(src[c], Mean(src[c], soft[c]));
            const uint32_t base = StyleMix(src[c], std::max<uint32_t>(soft[c], held), softWeight);
            const uint32_t rich = StyleMix(base, StyleProduct(base, base), mix.depth);
            // Screened with itself twice, faint glow counts fourfold and strong glow does not clip.
            const uint32_t dim = StyleProduct(255U - glow[c], 255U - glow[c]);
            const uint32_t light = ((255 - StyleProduct(dim, dim)) * glowWeight + 128) >> 8;
            dst[c] = static_cast<uint8_t>(255 - StyleProduct(255 - rich, 255 - light));
        }
        dst[3] = src[3];
    }
}

constinit const KernelTable<DreamyRow> kDreamyRow = {KYV_TABLE(DreamyRow)};

} // namespace kyv
