// The style filters.
#pragma once

#include "effects/PassThrough.h"

namespace kyv {

struct Dreamy : PassThrough<48, 1, kRequestNone> {};
struct LightRay : PassThrough<464, 1, kRequestB> {};
struct PencilSketch : PassThrough<96, 1, kRequestNone> {};

} // namespace kyv
