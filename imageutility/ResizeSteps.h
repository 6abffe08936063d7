// The step tables of Resize: how far the source position advances from one destination column, or
// row, to the next.
#pragma once

#include <cstddef>
#include <cstdint>

namespace KYVImageUtility {

// The fields of a table entry.
struct ResizeStep {
    uint32_t lower;    // positions that the lower neighbour advances, at most 255; bits 16 to 23
    uint32_t nearest;  // positions that the nearest neighbour advances, at most 255; bits 8 to 15
    uint32_t fraction; // of the way to the next position, in 1/128; bits 0 to 6
};

constexpr uint32_t PackStep(const ResizeStep& step) {
    return step.lower << 16 | step.nearest << 8 | step.fraction;
}

constexpr ResizeStep UnpackStep(uint32_t entry) {
    return {entry >> 16 & 255, entry >> 8 & 255, entry & 127};
}

// Writes destination + 1 entries; the last closes the table at the source's end. Position i is
// i * source / destination in 1/256, truncated; the last source position is reached as the one
// before it plus 127/128. source is at least 2, destination at least 1.
void BuildResizeSteps(uint32_t* entries, int32_t source, int32_t destination);

// Adds up the steps of count destination positions: for each the left neighbour, and the weights
// 128 - f and f of both neighbours.
void ExpandResizeSteps(int32_t* left, uint8_t* weights, const uint32_t* entries, int32_t count);

// Writes the indices that BilinearColumns describes, 16 for every two of count positions, and
// returns how many positions have them: up to the first two that do not come from four pixels in
// a row inside the source.
size_t BuildResizeShuffles(uint8_t* shuffles, const int32_t* left, int32_t count, int32_t source);

} // namespace KYVImageUtility
