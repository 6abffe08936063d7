// The picture of one frame, made row by row: drawn through the quad's map, keyed, blurred.
//
// Drawing reads the foreground, any row of it. Keying looks at the row below and blurring at `blur`
// rows to either side; they follow so closely that the nearest caches still have the rows.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/pip/Coverage.h"
#include "effects/pip/FreeformPiP.h"
#include "effects/pip/RowRing.h"
#include "effects/pip/SpanRows.h"
#include "imageutility/BoxBlurRows.h"
#include "imageutility/kernels/AlphaBlend.h"

namespace kyv {

struct PictureKey {
    bool enabled;
    uint32_t color; // 0x00RRGGBB
    uint8_t tolerance;
};

struct PictureSettings {
    PictureKey key;
    int32_t blur; // pixels
    bool ayuv;
    PixelBox box;        // where pixels may be drawn
    int32_t lead;        // how far below the row that is blended others may be asked for
    CCoverage* coverage; // is given the rows as they are, before the blur; may be null
};

class CPictureRows {
public:
    // A frame follows. Throws std::bad_alloc, as do the others.
    void Begin(CFreeformPiP& pip, const KYVImageUtility::CImageARGB& foreground,
               const PictureSettings& settings);

    // Makes all rows down to y that are not made yet, but for the blur.
    void MakeTo(int32_t y);

    // Blends row y, all of which come in order, over the frame's row.
    void Blend(int32_t y, uint8_t* frameRow, uint8_t opacity);

    // When all rows have been made the map counts as built.
    void End() {
        if (m_nDrawn == m_box.bottom) {
            m_pPip->EndRows();
        }
    }

    // Where the picture can be, with the neighbours that the key looks at; empty for a quad outside
    // the frame.
    const PixelBox& Box() const { return m_box; }

private:
    void Draw(int32_t y);
    void Finish(int32_t y);
    const uint8_t* BlurSource(int32_t y);

    CFreeformPiP* m_pPip = nullptr;
    PictureSettings m_settings = {};
    int32_t m_nWidth = 0;
    int32_t m_nHeight = 0;
    InstructionSet m_set = InstructionSet::Scalar;
    PixelBox m_box = {};   // with the neighbours that the key looks at
    PixelBox m_part = {};  // what is made of every row: with what the blur looks at
    PixelBox m_reach = {}; // of the blur
    uint32_t m_clear = 0;  // what is not covered
    int32_t m_nDrawn = 0;  // the next row to draw
    int32_t m_nMade = 0;   // the next row to finish
    int32_t m_nBlurred = 0;
    CRowRing m_rows;
    CBoxBlurRows m_window;
    CRowExtents m_extents; // of the quad
    std::vector<uint32_t> m_clearRow;
    std::vector<uint32_t> m_blurred;
};

} // namespace kyv
