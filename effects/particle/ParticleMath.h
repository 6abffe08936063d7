// Small arithmetic that the particle effects share.
#pragma once

#include <cstdint>

#include "platform/Truncate.h"

namespace kyv {

inline float TruncateToFloat(float value) {
    return static_cast<float>(TruncateToInt(value));
}

// How much taller than wide a square must be drawn on a target whose pixels the display stretches:
// (height * display width / display height) / width. 1 when the display's size is unknown.
inline float PixelAspect(int32_t width, int32_t height, int32_t displayWidth,
                         int32_t displayHeight) {
    if (width <= 0 || displayWidth <= 0 || displayHeight <= 0) {
        return 1.0F;
    }
    return static_cast<float>(height) * static_cast<float>(displayWidth) /
           static_cast<float>(displayHeight) / static_cast<float>(width);
}

} // namespace kyv
