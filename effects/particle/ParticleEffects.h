// The particle animations.
#pragma once

#include "effects/PassThrough.h"

namespace kyv {

struct RefractiveBubble : PassThrough<56, 1, kRequestB> {};
struct WaterRipple : PassThrough<40, 1, kRequestNone> {};
struct Bubble : PassThrough<56, 1, kRequestB> {};
struct Fireworks : PassThrough<40, 1, kRequestB> {};

} // namespace kyv
