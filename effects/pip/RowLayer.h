// A layer of the frame that is made row by row, blurred on the way, and blended.
//
// Rows are made in order and only when they are asked for, so closely before they are looked at
// that the nearest caches still have them.
#pragma once

#include <cstdint>
#include <limits>
#include <vector>

#include "effects/pip/SpanRows.h"
#include "imageutility/BoxBlurRows.h"
#include "imageutility/kernels/AlphaBlend.h"

namespace kyv {

// What rows a layer has, and which of them are there at once.
struct LayerPlan {
    int32_t width, height; // of the frame
    PixelBox content;      // in the frame; outside it all is clear
    uint32_t clear;        // the pixel that is not covered
    int32_t blur;          // pixels; less than half of the height
    int32_t lead;          // how far below the row that is blended others are asked for
    bool kept;             // what is blended stays there from frame to frame
};

class CRowLayer {
public:
    virtual ~CRowLayer() = default;

    // Makes all rows down to y that are not made yet, but for the blur. Throws std::bad_alloc, as
    // does Blend.
    void MakeTo(int32_t y);

    // Blends row y, all of which come in order, over the frame's row; null makes it and no more.
    void Blend(int32_t y, uint8_t* frameRow, uint8_t opacity);

    const PixelBox& Content() const { return m_plan.content; }

protected:
    // The extents are empty after it, and are to be told of what may be covered.
    void Lay(const LayerPlan& plan);
    // A frame follows.
    void Rewind(InstructionSet set);

    // Makes the part's columns of a row of the content.
    virtual void Make(int32_t y) = 0;
    // False for a row to blend that is there from an earlier frame.
    virtual bool IsOutdated(int32_t) const { return true; }

    // A row that has been made, from the frame's column 0 on.
    uint32_t* Row(int32_t y) {
        return m_rows.data() + static_cast<size_t>(y) % m_nPlaces * m_nWidth;
    }
    // The content with what the blur looks at.
    const PixelBox& Part() const { return m_part; }
    InstructionSet Set() const { return m_set; }

    CRowExtents m_extents;

private:
    static constexpr int32_t kNoRow = std::numeric_limits<int32_t>::min();

    const uint8_t* BlurSource(int32_t y);
    uint32_t* Blended(int32_t y);
    template <class Take>
    void ForReach(int32_t y, Take&& take) const;
    void Blur(int32_t y);

    LayerPlan m_plan = {};
    InstructionSet m_set = InstructionSet::Scalar;
    PixelBox m_part = {};
    PixelBox m_reach = {}; // of the blur
    size_t m_nWidth = 0;
    size_t m_nPlaces = 1;         // a row takes that of one which lies so many above
    int32_t m_nMade = 0;          // the next row to make
    int32_t m_nBlurred = kNoRow;  // the row that the window is at
    std::vector<uint32_t> m_rows; // before the blur
    std::vector<uint32_t> m_blurred;
    std::vector<uint32_t> m_clearRow;
    CBoxBlurRows m_window;
};

} // namespace kyv
