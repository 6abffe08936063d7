// The definition of mixing by a mask.
#include "effects/style/MaskMixRow.h"

#include "effects/style/StyleMath.h"

namespace kyv {

void MaskMixRow_scalar(uint8_t* dst, const uint8_t* src, const uint8_t* effect,
                       const uint8_t* weights, size_t count) {
    for (size_t i = 0; i < count; ++i) {
        const uint32_t weight = weights[i] + (weights[i] >> 7); // 0..256
        for (size_t c = i * 4; c < i * 4 + 4; ++c) {
            dst[c] = static_cast<uint8_t>(StyleMix(src[c], effect[c], weight));
        }
    }
}

constinit const KernelTable<MaskMixRow> kMaskMixRow = {KYV_TABLE(MaskMixRow)};

} // namespace kyv
