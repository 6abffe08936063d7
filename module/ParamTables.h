// The parameter records of every effect, in the order of their values in the parameter buffer.
#pragma once

#include <array>

#include "interface/HostInterface.h"

namespace kyv {

template <size_t N>
using ParamTable = std::array<ParamDescriptor, N>;

extern const ParamTable<4> kRefractiveBubbleParams;
extern const ParamTable<1> kWaterRippleParams;
extern const ParamTable<4> kBubbleParams;
extern const ParamTable<3> kFireworksParams;
extern const ParamTable<30> kFreeformParams;
extern const ParamTable<4> kTestAlphaParams;
extern const ParamTable<4> kAlphaTransitionParams;
extern const ParamTable<5> kDreamyParams;
extern const ParamTable<2> kLightRayParams;
extern const ParamTable<8> kPencilSketchParams;
extern const ParamTable<3> kColorTemperatureParams;
extern const ParamTable<2> kWhiteBalanceParams;

} // namespace kyv
