// The weight that the blends share.
#pragma once

#include <cstdint>

namespace kyv {

// Source alpha times opacity, 0..255. An opacity of 255 gives the alpha itself.
constexpr uint32_t BlendWeight(uint32_t alpha, uint32_t opacity) {
    return ((opacity + 1) * alpha) >> 8;
}

} // namespace kyv
