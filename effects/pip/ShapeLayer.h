// The border or the shadow: a colour, or a gradient of two, where the picture, its border or both
// are. It is kept from frame to frame, and of it only those rows are made again for which something
// has changed.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "effects/pip/BorderShape.h"
#include "effects/pip/Coverage.h"
#include "effects/pip/RowLayer.h"

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

struct LayerStyle {
    LayerColor first = {}, second = {};
    int32_t direction = 0; // of the gradient between the two
    int32_t blur = 0;      // pixels

    bool operator==(const LayerStyle&) const = default;
};

// All that a layer depends on, but for the coverage.
struct LayerRecipe {
    BorderShape shape;
    bool ayuv;
    LayerStyle style = {};
    bool takesPicture = false; // the picture is part of the layer
    bool takesBorder = false;  // and the border, where the picture leaves it
    bool cutsPicture = false;  // where the picture is, the layer has zeros
    int32_t dx = 0, dy = 0;    // how far it is moved

    bool operator==(const LayerRecipe&) const = default;
};

class CShapeLayer final : public CRowLayer {
public:
    // A frame follows. The quad's and the border's pixels and the coverage must be there until End,
    // the former finished and the latter as it goes: row y is made from its rows down to
    // y + blur - dy. Throws std::bad_alloc.
    void Begin(const LayerRecipe& recipe, const CSpanRows& quad, const CSpanRows& border,
               const CCoverage& coverage, InstructionSet set);

    void End() { m_made = {m_recipe, m_pCoverage->Serial()}; }

private:
    struct Made {
        LayerRecipe recipe;
        uint64_t coverage;

        bool operator==(const Made&) const = default;
    };

    void PrepareExtents(const CSpanRows& quad);
    void PrepareGradient();
    void Make(int32_t y) override;
    bool IsOutdated(int32_t y) const override {
        return m_bRemake || m_pCoverage->LastChanged() >= y - m_recipe.dy - m_recipe.style.blur;
    }

    // Empty while it is not known what the pixels are.
    std::optional<Made> m_made;
    LayerRecipe m_recipe = {};
    const CSpanRows* m_pBorder = nullptr;
    const CCoverage* m_pCoverage = nullptr;
    bool m_bRemake = true;
    uint32_t m_clear = 0;
    PixelBox m_gradientBox = {};   // right and bottom are inside
    std::vector<float> m_gradient; // of the part's columns; empty for one colour
    Runs m_covered;
};

} // namespace kyv
