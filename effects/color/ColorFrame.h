// What the colour corrections share: a frame of either pixel format as rows of B, G, R, A, and the
// comparison that leaves the left half of the picture as it was.
#pragma once

#include <cstdint>

#include "imageutility/ImageUtility.h"
#include "module/FrameGeometry.h"

namespace kyv {

// One call's view as ARGB images. ARGB frames are wrapped; an AYUV frame is converted into a
// private image on which the work runs in place, and Finish converts all of it back. So in AYUV
// frames the rows that a field selector leaves out carry the source after its round trip, while in
// ARGB frames they are not touched.
class CColorFrame {
public:
    // input and output are whole frames of the geometry; they may be one and the same.
    CColorFrame(const EffectContext& context, const FrameGeometry& geometry, void* output,
                const void* input);

    // Applies a row operation, correct(dst, src, count), to the rows of the context's field. The
    // first width / 2 pixels are copied as they are when compare is set.
    template <class Correct>
    void ForEachRow(bool compare, Correct&& correct) {
        const int32_t half = compare ? m_source.GetWidth() / 2 : 0;
        for (int32_t y = m_firstRow; y < m_source.GetHeight(); y += m_rowStep) {
            uint8_t* dst = m_target.Row(y);
            const uint8_t* src = m_source.Row(y);
            CopyPixels(dst, src, half);
            correct(dst + half * 4, src + half * 4,
                    static_cast<size_t>(m_source.GetWidth() - half));
        }
    }

    // Writes an AYUV frame's view to the output. Nothing to do for ARGB frames.
    void Finish();

private:
    static void CopyPixels(uint8_t* dst, const uint8_t* src, int32_t count);

    const FrameGeometry m_geometry;
    uint8_t* m_pOutput;
    int32_t m_cpuLevel;
    int32_t m_firstRow = 0;
    int32_t m_rowStep = 1;
    bool m_ayuv;
    KYVImageUtility::CImageARGB m_private; // of AYUV frames
    KYVImageUtility::CImageARGB m_source;
    KYVImageUtility::CImageARGB m_target;
};

} // namespace kyv
