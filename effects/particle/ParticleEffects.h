// The particle animations that only pass their input through.
#pragma once

#include "effects/PassThrough.h"

namespace kyv {

struct WaterRipple : PassThrough<40, 1, kRequestNone> {};

} // namespace kyv
