// How bright the parts of a picture are, so that what counts as light goes with the picture: in a
// dull or a dark one its brightest parts are its lights.
#pragma once

#include <cstdint>

#include "effects/style/HighlightRow.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

class CTones {
public:
    // Counts every second pixel of every second row. The brightness is that of HighlightRow.
    void Count(const KYVImageUtility::CImageARGB& image);

    // The brightness that a share of the pixels, 0..1, reach or exceed.
    uint32_t ReachedBy(float share) const;

private:
    uint32_t m_counts[256] = {};
    uint32_t m_total = 0;
};

// What of a picture shines: its brightest parts, whatever their level, but no more than a part of
// it and nothing that is nearly black. lowest, 0..230, is the dimmest that may count.
Highlight LightsOf(const CTones& tones, uint32_t lowest);

} // namespace kyv
