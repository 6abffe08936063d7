// The descriptor records of the twelve effects, in the order in which the host enumerates them.
#pragma once

#include "interface/HostInterface.h"

namespace kyv {

inline constexpr uint32_t kEffectCount = 12;
extern const EffectDescriptor kEffects[kEffectCount];

} // namespace kyv
