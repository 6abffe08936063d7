// The picture alone, row by row: a row is keyed and handed on as soon as it and the one below are
// drawn, while the nearest cache has them, and no layer of the frame's size is touched.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/pip/ColorKeyPass.h"
#include "effects/pip/FreeformPiP.h"
#include "effects/pip/PipLayers.h"

namespace kyv {

// Receives finished rows of the box, all of them, top to bottom.
class CRowSink {
public:
    // The first pixel of the box in row y.
    virtual void Take(int32_t y, const uint8_t* pixels) = 0;

protected:
    ~CRowSink() = default;
};

// A target for CFreeformPiP::RenderRows whose rows come from top to bottom, in a frame of the given
// width. What is drawn below the box is dropped. The result is the same as that of a layer and its
// ColorKey.
class CPictureRows final : public CRowTarget {
public:
    CPictureRows(int32_t width, const PixelBox& box, const PictureKey& key, bool ayuv,
                 int32_t cpuLevel, CRowSink& sink);

    uint8_t* Row(int32_t y) override;

    // Hands on what is left.
    void Finish();

private:
    uint32_t* Slot(int32_t y) { return m_rows.data() + (y & 1 ? m_width : 0); }
    uint8_t* Pixels(int32_t y) { return reinterpret_cast<uint8_t*>(Slot(y) + m_box.left); }
    void FinishRow();

    size_t m_width;
    PixelBox m_box;
    bool m_bKeyed;
    CColorKeyPass m_key;
    CRowSink& m_sink;
    // Two rows in turn: the next to be finished and the one below it. Rows that have not been drawn
    // on are clear.
    std::vector<uint32_t> m_rows;
    int32_t m_nNext;
};

} // namespace kyv
