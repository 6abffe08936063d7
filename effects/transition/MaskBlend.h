// The blend of a mask transition at one moment.
#pragma once

#include <cstdint>

#include "effects/transition/MaskBlendRow.h"

namespace kyv {

struct MaskBlendParams {
    float percentage;   // 0 shows picture 0, 1 picture 1
    int32_t smoothness; // half the width of the soft band, in mask values; 0 is a hard cut
    bool hasBorder;
    uint8_t edge[3]; // the border's colour, in the order of the pixel's bytes
};

// Values around the threshold T = percentage * (2 * smoothness + 255) - smoothness are blended;
// above picture 0 stays, below picture 1 has come. The border has its full colour at T.
// Outside their ranges the parameters follow the same rule, as far as numbers go; a percentage that
// is not a number counts as 0.
void BuildMaskBlend(MaskBlend& blend, const MaskBlendParams& params);

} // namespace kyv
