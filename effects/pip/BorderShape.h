// The shape of a quad's border.
#pragma once

#include <cstdint>

#include "effects/pip/Rasterizer.h"
#include "effects/pip/SpanRows.h"

namespace kyv {

// Adds the border of a quad with corners A, B, C, D, as far as it is in the window: a band of
// `size` pixels about every side, wedges on the outer side of every corner and discs that round it.
void AddBorderShape(CSpanRows& spans, const RasterWindow& window, const RasterPoint (&quad)[4],
                    int32_t size);

} // namespace kyv
