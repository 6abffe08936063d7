// Rows of the style effects' frames.
#include "effects/style/StyleFrame.h"

#include <cstring>

#include "imageutility/kernels/ToARGB.h"
#include "imageutility/kernels/ToAYUV.h"

namespace kyv {

const uint8_t* StyleFrame::Load(int32_t y, uint8_t* block) const {
    const uint8_t* row = input + y * pitchBytes;
    if (!ayuv) {
        return row;
    }
    kToARGB.For(level.set)(block, row, static_cast<size_t>(width));
    return block;
}

void StyleFrame::Store(int32_t y, const uint8_t* row) const {
    if (ayuv) {
        kToAYUV.For(level.set)(output + y * pitchBytes, row, static_cast<size_t>(width));
    }
}

void StyleFrame::Copy() const {
    if (input == output) {
        return;
    }
    for (int32_t y = firstRow; y < height; y += rowStep) {
        std::memcpy(output + y * pitchBytes, input + y * pitchBytes,
                    static_cast<size_t>(width) * 4);
    }
}

} // namespace kyv
