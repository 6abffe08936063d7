// From a frame to its glow.
#include "effects/style/DreamyFilter.h"

#include <algorithm>

#include "effects/style/DreamyRow.h"
#include "effects/style/HighlightRow.h"
#include "effects/style/MaskMixRow.h"

namespace kyv {
namespace {

constexpr float kReferenceWidth = 720.0F;

// From the brighter half of the range on a pixel counts as light, from 234 on in full.
constexpr Highlight kLights = {.floor = 132, .slope = 40};

// Standard deviations in pixels of a frame of the reference width.
float SoftSigma(float degree) {
    return 0.9F + 0.19F * degree;
}
float GlowSigma(float degree) {
    return 3.0F + 0.72F * degree;
}

} // namespace

void CDreamyFilter::Gather(const StyleFrame& frame) {
    const HighlightRow highlight = kHighlightRow.For(frame.level.set);
    for (int32_t y = 0; y < frame.height; ++y) {
        const uint8_t* row = frame.Load(y, m_source.data());
        m_soft.TakeRow(y, row, m_softRows);
        highlight(m_result.data(), row, static_cast<size_t>(frame.width), kLights);
        m_glow.TakeRow(y, m_result.data(), m_glowRows);
    }
}

void CDreamyFilter::Render(const StyleFrame& frame, uint32_t degree, const MaskShape& mask) {
    m_mask.Update(mask, frame.width, frame.height);
    if (m_mask.IsNothing()) {
        frame.Copy();
        return;
    }
    const auto amount = static_cast<float>(degree);
    const float scale = static_cast<float>(frame.width) / kReferenceWidth;
    const float softSigma = SoftSigma(amount) * scale;
    const float glowSigma = GlowSigma(amount) * scale;
    m_source.resize(static_cast<size_t>(frame.width) * 4);
    m_result.resize(static_cast<size_t>(frame.width) * 4);
    m_soft.Prepare(frame.width, frame.height, ChooseShrinkBits(frame.width, softSigma, 960),
                   frame.level);
    m_glow.Prepare(frame.width, frame.height, ChooseShrinkBits(frame.width, glowSigma, 480),
                   frame.level);
    m_soft.PrepareRows(m_softRows);
    m_glow.PrepareRows(m_glowRows);
    Gather(frame);
    m_soft.Blur(softSigma);
    m_glow.Blur(glowSigma);

    const DreamyMix mix = {
        .soft = static_cast<uint16_t>(std::min<uint32_t>(112 + degree * 4, 208)),
        .glow = static_cast<uint16_t>(44 + degree * 3),
        .depth = static_cast<uint16_t>(8 + degree * 5 / 4),
    };
    const DreamyRow dreamy = kDreamyRow.For(frame.level.set);
    const auto width = static_cast<size_t>(frame.width);
    for (int32_t y = frame.firstRow; y < frame.height; y += frame.rowStep) {
        const uint8_t* source = frame.Load(y, m_source.data());
        uint8_t* target = frame.Target(y, m_result.data());
        if (m_mask.IsWhole()) {
            dreamy(target, source, m_soft.Row(y, m_softRows), m_glow.Row(y, m_glowRows), width,
                   mix);
        } else {
            dreamy(m_result.data(), source, m_soft.Row(y, m_softRows), m_glow.Row(y, m_glowRows),
                   width, mix);
            kMaskMixRow.For(frame.level.set)(target, source, m_result.data(), m_mask.Row(y), width);
        }
        frame.Store(y, target);
    }
}

} // namespace kyv
