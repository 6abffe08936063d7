// The shape of a quad's border.
#pragma once

#include <algorithm>
#include <cstdint>

#include "effects/pip/Rasterizer.h"
#include "effects/pip/SpanRows.h"

namespace kyv {

struct BorderShape {
    int32_t width, height; // of the frame
    RasterPoint corners[4];
    int32_t size; // pixels; below 0 for no border

    // About the corners; no coordinate of one counts beyond 99999.
    PixelBox Box() const;
    PixelBox WidenedBox() const { return Box().Grown(std::max(size, 0)); }
    bool operator==(const BorderShape&) const = default;
};

// Adds the border as far as it is in the frame: a band of `size` pixels about every side, wedges on
// the outer side of every corner and discs that round it.
void AddBorderShape(CSpanRows& spans, const BorderShape& shape);

} // namespace kyv
