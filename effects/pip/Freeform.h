// The free-form picture-in-picture.
#pragma once

#include "effects/PassThrough.h"

namespace kyv {

struct Freeform : PassThrough<32, 2, kRequestNone> {};

} // namespace kyv
