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

// The four mask parameters, which lie one after the other: rectangle, shape, depth, inverse.
// Normalised.
MaskShape ReadMask(const CParamReader& params, uint32_t firstIndex);

GpuMask ToGpuMask(const MaskShape& mask);

} // namespace kyv
