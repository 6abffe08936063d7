// The other ways to read a picture through map entries: spans of pixels, one form for all levels.
//
// Entries are as in QuadSampleRow.h. None of these but the filtered one writes alpha.
#pragma once

#include <cstddef>
#include <cstdint>

#include "effects/pip/QuadSampleRow.h"
#include "effects/pip/ResampleFilter.h"

namespace kyv {

inline constexpr int kGridSamples = 9;

// The nearest pixel above and left of the position. Pixels past the picture's size are left as
// they are; the first column past it is not: there the next row begins.
void RenderNearest(uint8_t* dst, const uint32_t* map, size_t count, const SamplePicture& picture);

// Nine entries a pixel, a 3 x 3 grid row by row, under the tent 1 2 1 / 2 4 2 / 1 2 1. A sample
// without a pixel still counts in the divisor 16, which darkens a quad's rim. Intended. The
// bilinear form takes the whole fraction.
void RenderGridNearest(uint8_t* dst, const uint32_t* map, size_t count,
                       const SamplePicture& picture);
void RenderGridBilinear(uint8_t* dst, const uint32_t* map, size_t count,
                        const SamplePicture& picture);

// A horizontal and a vertical contribution record a pixel, side by side; pixels without are left
// as they are. Sums are rounded and clamped, and the pixel becomes opaque.
void RenderFiltered(uint8_t* dst, const ContributionRecord* records, size_t count,
                    const SamplePicture& picture);

// Black and white squares of 32 pixels of the picture.
void RenderChecker(uint8_t* dst, const uint32_t* map, size_t count);

} // namespace kyv
