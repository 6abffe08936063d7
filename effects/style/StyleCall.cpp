// Parameters of the style effects.
#include "effects/style/StyleCall.h"

namespace kyv {

MaskShape ReadMask(const CParamReader& params, uint32_t firstIndex) {
    float sides[4];
    params.Bytes(firstIndex, sides, sizeof sides);
    return Normalize({
        .left = sides[0],
        .top = sides[1],
        .right = sides[2],
        .bottom = sides[3],
        .ellipse = params.Int(firstIndex + 1) == 1,
        .depth = params.Float(firstIndex + 2),
        .outside = params.Int(firstIndex + 3) != 0,
    });
}

GpuMask ToGpuMask(const MaskShape& mask) {
    return {
        .left = mask.left,
        .top = mask.top,
        .right = mask.right,
        .bottom = mask.bottom,
        .ellipse = mask.ellipse ? 1U : 0U,
        .depth = mask.depth,
        .outside = mask.outside ? 1U : 0U,
    };
}

} // namespace kyv
