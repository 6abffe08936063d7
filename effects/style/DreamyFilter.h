// The glow of the dreamy effect.
//
// The picture is reduced and blurred twice: as it is by a little, and its lights alone by a lot.
// The small blur softens the mid-tones while the source's edges show through; the lights' wide blur
// is screened over that as a bloom that fades into the surroundings. What counts as light goes with
// the picture, so that a dark one glows too. Deep tones are deepened and take little of either, so
// that the contrast holds. All of that is worked out on the reduced picture, as a veil that the
// frame's rows take on.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/style/SmallPicture.h"
#include "effects/style/StyleFrame.h"
#include "effects/style/StyleMask.h"
#include "effects/style/Tones.h"

namespace kyv {

// Keeps its buffers from frame to frame.
class CDreamyFilter {
public:
    // degree 1..40; the mask a normalised one. Throws std::bad_alloc, with nothing written.
    void Render(const StyleFrame& frame, uint32_t degree, const MaskShape& mask);

private:
    void Prepare(const StyleFrame& frame, float softSigma, float glowSigma);
    void MakeVeil(const StyleFrame& frame, uint32_t degree);

    CSmallPicture m_soft; // the picture, and then the veil
    CSmallPicture m_glow; // its lights, at a fraction of that
    SmallPictureRows m_softRows;
    SmallPictureRows m_glowRows;
    CTones m_tones;
    CStyleMask m_mask;
    std::vector<uint8_t> m_source; // rows of the frame's width
    std::vector<uint8_t> m_result;
};

} // namespace kyv
