// The parameters that the mask transitions have in common.
#pragma once

#include <cstdint>

namespace kyv {

struct TransitionParams {
    enum Param : uint32_t {
        Percentage,  // float    0 input 0 .. 1 input 1
        Smoothness,  // int      0..40: half the width of the soft band, in grey levels
        BorderColor, // colour
        Border,      // boolean, one byte: tints the soft band
        ParamCount,
    };
};

} // namespace kyv
