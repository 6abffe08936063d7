// Between the host's images and the module's frames.
//
// A frame is packed pixels B, G, R, A of 8 bits, straight alpha, rows from the top. Going to 8 bits
// a channel is clamped to its range and rounded to the nearest, halves up; NaN is 0. Coming back is
// exact: v * 257 for 16 bits, v / 255 for floats.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include "bridges/openfx/OpenFx.h"
#include "bridges/openfx/Suites.h"

namespace kyvofx {

using Frame = std::vector<uint32_t>;

enum class Depth { Byte, Short, Float };

// An image of the host: R, G, B, A from (x1, y1), which is the lowest row, in rows that may be
// padded and may run downwards in memory.
struct Image {
    uint8_t* data;
    RectI bounds; // not empty
    ptrdiff_t rowBytes;
    Depth depth;
    bool isPremultiplied;
};

// The rows to write.
enum class Rows { All, Even, Odd }; // by y

// Nothing when the set describes no image of ours: no data, empty bounds, other components or
// depths, rows shorter than their pixels.
std::optional<Image> ImageOf(const CProps& props);

int64_t Width(const RectI& rect);
int64_t Height(const RectI& rect);
bool IsEmpty(const RectI& rect);
RectI Intersection(const RectI& a, const RectI& b);

// The part of the image within the area as a frame of the area's size; transparent black beyond.
void ReadImage(const Image& image, const RectI& area, Frame& frame);

// The frame, which fills the area, into the image's pixels within the window; those beyond the area
// become transparent black. Pixels outside the window and the other rows are left alone.
void WriteImage(const Frame& frame, const RectI& area, const Image& image, const RectI& window,
                Rows rows);

// The frame at another size, bilinear between pixel centres, edges repeated.
Frame Scaled(const Frame& frame, size_t width, size_t height, size_t newWidth, size_t newHeight);

} // namespace kyvofx
