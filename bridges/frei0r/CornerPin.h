// The corner pin: the picture-in-picture with one input, over a background of a colour and an
// opacity instead of a second clip.
//
// The effect keeps the alpha of what it draws on and takes its picture as solid, so over anything
// but a solid background the coverage is measured: the same frame is drawn over black and over
// white, and where the two differ, the background shows. What is left of the colour is the
// picture's own, without a rim of the background. The input's own alpha is measured in the same
// way, by pinning it as a grey picture.
#pragma once

#include <cstdint>
#include <vector>

#include "bridges/frei0r/EffectPlugin.h"

namespace kyvfrei0r {

class CCornerPin final : public CEffectPlugin {
public:
    CCornerPin(const PluginTable& table, const EffectDescriptor& effect, uint32_t width,
               uint32_t height);

protected:
    // With all corners at the frame's and nothing else in use the output is the input.
    KyvStatus Render(const void* input, const void* unused, void* output) override;
    void SetOwn(const ParamTable& param, const void* value) override;
    void GetOwn(const ParamTable& param, void* value) const override;

private:
    using Frame = std::vector<uint32_t>;

    bool IsNeutral() const;
    KyvStatus RenderOver(uint32_t background, const void* picture, Frame& result);
    KyvStatus RenderAlpha(const void* input, Frame& result);
    void Compose(uint8_t* output, const uint8_t* alpha) const;

    Frei0rColor m_color = {0, 0, 0};
    double m_opacity = 0;
    Frame m_background, m_grey, m_overBlack, m_overWhite, m_alpha;
    uint32_t m_backgroundPixel = 0;
};

} // namespace kyvfrei0r
