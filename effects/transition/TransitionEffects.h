// The mask transitions.
#pragma once

#include "effects/PassThrough.h"

namespace kyv {

struct TestAlpha : PassThrough<32, 2, kRequestA> {};
struct AlphaTransition : PassThrough<40, 2, kRequestA> {};

} // namespace kyv
