// What the callbacks of the style effects share: frames and parameters as filters and GPU helpers
// may have them.
#pragma once

#include <cstdint>

#include "effects/style/StyleFrame.h"
#include "effects/style/StyleMask.h"
#include "interface/FrameGeometry.h"
#include "interface/GpuHelper.h"
#include "interface/HostInterface.h"
#include "interface/ParamReader.h"

namespace kyv {

// The call's view of the input and of the context's frame.
StyleFrame MakeStyleFrame(const EffectContext& context, const FrameGeometry& geometry,
                          const void* input);

// The mask of an effect whose parameters name one. Normalised.
template <class Param>
MaskShape ReadMask(const CParamReader<Param>& params) {
    const auto sides = params.template Floats<4>(Param::MaskRect);
    return Normalize({
        .left = sides[0],
        .top = sides[1],
        .right = sides[2],
        .bottom = sides[3],
        .ellipse = params.Int(Param::MaskType) == 1,
        .depth = params.Float(Param::MaskDepth),
        .outside = params.Int(Param::MaskInverse) != 0,
    });
}

GpuMask ToGpuMask(const MaskShape& mask);

} // namespace kyv
