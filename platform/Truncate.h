// Numbers as the integers before their point, defined for every value.
#pragma once

#include <cstdint>

namespace kyv {

// Truncates towards zero. What 32 bits cannot hold becomes the nearest number that they can, and
// what is not a number 0.
inline int32_t TruncateToInt(float value) {
    if (value >= 2147483648.0F) {
        return INT32_MAX;
    }
    if (value <= -2147483648.0F) {
        return INT32_MIN;
    }
    return value == value ? static_cast<int32_t>(value) : 0;
}

} // namespace kyv
