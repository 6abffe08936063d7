// A style effect's view of the host's frames as rows of B, G, R, A, whatever their format.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/CpuFeatures.h"

namespace kyv {

// Input and output have the same geometry and may be one and the same, so a row of the input must
// not be read once its row of the output is stored.
struct StyleFrame {
    const uint8_t* input; // the view's first pixel
    uint8_t* output;
    ptrdiff_t pitchBytes;
    int32_t width;
    int32_t height;
    bool ayuv;
    int32_t firstRow; // the rows that are written: firstRow, firstRow + rowStep, ...
    int32_t rowStep;
    ResolvedLevel level;

    // The row in the input, or its conversion in the block, which holds width pixels.
    const uint8_t* Load(int32_t y, uint8_t* block) const;

    // Where the result of a row is to be written before Store: the output itself, or the block.
    uint8_t* Target(int32_t y, uint8_t* block) const {
        return ayuv ? block : output + y * pitchBytes;
    }
    // Puts the row that Target named into the output.
    void Store(int32_t y, const uint8_t* row) const;

    // Copies the rows that are written, as they are.
    void Copy() const;
};

} // namespace kyv
