// The definition of keeping highlights.
#include "effects/style/HighlightRow.h"

#include <algorithm>

#include "effects/style/StyleMath.h"

namespace kyv {

void HighlightRow_scalar(uint8_t* dst, const uint8_t* src, size_t count,
                         const Highlight& highlight) {
    for (size_t i = 0; i < count; ++i, src += 4, dst += 4) {
        const uint32_t b = src[0];
        const uint32_t g = src[1];
        const uint32_t r = src[2];
        const uint32_t brightness = StyleBrightness(b, g, r);
        const uint32_t above = brightness > highlight.floor ? brightness - highlight.floor : 0;
        const uint32_t weight = std::min((above * highlight.slope) >> 4, 255U);
        const uint32_t square = StyleProduct(weight, weight);
        dst[0] = static_cast<uint8_t>(StyleProduct(b, square));
        dst[1] = static_cast<uint8_t>(StyleProduct(g, square));
        dst[2] = static_cast<uint8_t>(StyleProduct(r, square));
        dst[3] = 0;
    }
}

constinit const KernelTable<HighlightRow> kHighlightRow = {KYV_TABLE(HighlightRow)};

} // namespace kyv
