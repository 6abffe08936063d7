// A layer about the picture, its border or its shadow: a work image of the frame's size whose alpha
// marks what is covered. It is kept from frame to frame, and of it only those rows are made again
// for which something has changed.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "effects/pip/Coverage.h"
#include "effects/pip/Rasterizer.h"
#include "effects/pip/RowRing.h"
#include "effects/pip/SpanRows.h"
#include "imageutility/BoxBlurRows.h"
#include "imageutility/kernels/AlphaBlend.h"

namespace kyv {

// B, G and R of an ARGB frame, V, U and Y of an AYUV frame.
struct LayerColor {
    uint8_t channel[3];

    uint32_t Opaque() const {
        return 0xFF000000U | static_cast<uint32_t>(channel[2]) << 16 |
               static_cast<uint32_t>(channel[1]) << 8 | channel[0];
    }
    bool operator==(const LayerColor&) const = default;
};

// The shape of a border depends on this.
struct BorderShape {
    int32_t width, height; // of the frame
    RasterPoint corners[4];
    int32_t size;

    bool operator==(const BorderShape&) const = default;
};

// All that a layer depends on, but for the coverage.
struct LayerRecipe {
    BorderShape shape;
    PixelBox box; // within which the picture and the shape are
    bool ayuv;
    bool takesPicture = false; // the picture is part of the layer
    bool takesBorder = false;  // and the border, where the picture leaves it
    bool cutsPicture = false;  // where the picture is, the layer has zeros
    int32_t dx = 0, dy = 0;    // how far it is moved
    LayerColor first = {}, second = {};
    int32_t direction = 0; // of the gradient between the two colours
    PixelBox gradientBox;  // its rectangle, whose right and bottom are inside
    int32_t blur = 0;      // pixels

    bool operator==(const LayerRecipe&) const = default;
};

class CPipLayer {
public:
    // A frame follows. The quad's and the border's pixels and the coverage must be there until End,
    // the former finished and the latter as it goes: row y is made from its rows down to
    // y + blur - dy. Throws std::bad_alloc, as does Blend.
    void Begin(const LayerRecipe& recipe, const CSpanRows& quad, const CSpanRows& border,
               const CCoverage& coverage, InstructionSet set);

    // Blends row y, all of which come in order, over the frame's row; null makes it and no more.
    void Blend(int32_t y, uint8_t* frameRow, uint8_t opacity);

    void End() { m_made = {m_recipe, m_pCoverage->Serial()}; }

private:
    struct Made {
        LayerRecipe recipe;
        uint64_t coverage;

        bool operator==(const Made&) const = default;
    };

    void PrepareExtents(const CSpanRows& quad);
    void PrepareGradient();
    uint8_t* Kept(int32_t x, int32_t y) {
        return reinterpret_cast<uint8_t*>(m_pixels.data() + static_cast<size_t>(y) * m_width +
                                          static_cast<size_t>(x));
    }
    template <class Take>
    void ForReach(int32_t y, Take&& take) const;
    void MakeRow(int32_t y);
    void Fill(int32_t y, uint8_t* part);
    const uint8_t* BlurSource(int32_t y);

    // Empty while it is not known what the pixels are.
    std::optional<Made> m_made;
    std::vector<uint32_t> m_pixels;
    size_t m_width = 0;

    LayerRecipe m_recipe = {};
    const CSpanRows* m_pBorder = nullptr;
    const CCoverage* m_pCoverage = nullptr;
    InstructionSet m_set = InstructionSet::Scalar;
    bool m_bRemake = true;
    PixelBox m_content = {}; // what may be covered
    PixelBox m_part = {};    // with what the blur looks at
    PixelBox m_reach = {};   // of the blur
    uint32_t m_clear = 0;
    int32_t m_nBlurred = -1; // the row that the window is at
    int32_t m_nSources = 0;  // the next row for the window
    CRowRing m_sources;
    CBoxBlurRows m_window;
    std::vector<uint32_t> m_clearRow;
    std::vector<float> m_gradient; // of the part's columns; empty for one colour
    CRowExtents m_extents;         // of what may be covered
    Runs m_picture, m_border, m_covered;
};

} // namespace kyv
