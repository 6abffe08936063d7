// The glow of the dreamy effect.
//
// The picture is blurred twice at a fraction of its size: as it is by a little, and its highlights
// alone by a lot. Half of the small blur softens the mid-tones while the source's edges show
// through; the highlights' wide blur is screened over that as a bloom that fades into the
// surroundings. Dark parts take little of the softness, so blacks stay black.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/style/SmallPicture.h"
#include "effects/style/StyleFrame.h"
#include "effects/style/StyleMask.h"

namespace kyv {

// Keeps its buffers from frame to frame.
class CDreamyFilter {
public:
    // degree 1..40; the mask a normalised one. Throws std::bad_alloc, with nothing written.
    void Render(const StyleFrame& frame, uint32_t degree, const MaskShape& mask);

private:
    void Gather(const StyleFrame& frame);

    CSmallPicture m_soft;
    CSmallPicture m_glow;
    SmallPictureRows m_softRows;
    SmallPictureRows m_glowRows;
    CStyleMask m_mask;
    std::vector<uint8_t> m_source; // rows of the frame's width
    std::vector<uint8_t> m_result;
};

} // namespace kyv
