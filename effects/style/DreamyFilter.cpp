// From a frame to its glow.
#include "effects/style/DreamyFilter.h"

#include <algorithm>

#include "effects/style/DreamyRow.h"
#include "effects/style/HighlightRow.h"
#include "effects/style/MaskMixRow.h"

namespace kyv {
namespace {

constexpr float kReferenceWidth = 720.0F;

// What is darker is no light in any picture.
constexpr uint32_t kLowestLight = 60;

// Enlarging softens as well, so a blur this many small pixels wide shows none of their squares.
constexpr float kLeastSigma = 1.1F;

// Standard deviations in pixels of a frame of the reference width.
float SoftSigma(float degree) {
    return 1.7F + 0.17F * degree;
}
float GlowSigma(float degree) {
    return 5.0F + 0.75F * degree;
}

} // namespace

void CDreamyFilter::Prepare(const StyleFrame& frame, float softSigma, float glowSigma) {
    const auto widest = static_cast<size_t>(std::max(frame.width, 2)); // of either picture
    m_source.resize(widest * 4);
    m_result.resize(widest * 4);
    const int32_t bits = ChooseShrinkBits(frame.width, softSigma, 960, kLeastSigma);
    m_soft.Prepare(frame.width, frame.height, bits, frame.level);
    m_soft.PrepareRows(m_softRows);
    const int32_t width = m_soft.GetImage().GetWidth();
    const float sigma = glowSigma / static_cast<float>(1 << bits);
    m_glow.Prepare(width, m_soft.GetImage().GetHeight(),
                   ChooseShrinkBits(width, sigma, 480, kLeastSigma), frame.level);
    m_glow.PrepareRows(m_glowRows);
}

void CDreamyFilter::MakeVeil(const StyleFrame& frame, uint32_t degree) {
    const auto amount = static_cast<float>(degree);
    const float scale = static_cast<float>(frame.width) / kReferenceWidth;
    const float softSigma = SoftSigma(amount) * scale;
    const float glowSigma = GlowSigma(amount) * scale;
    Prepare(frame, softSigma, glowSigma);
    for (int32_t y = 0; y < frame.height; ++y) {
        m_soft.TakeRow(y, frame.Load(y, m_source.data()), m_softRows);
    }

    KYVImageUtility::CImageARGB& small = m_soft.GetImage();
    const auto width = static_cast<size_t>(small.GetWidth());
    m_tones.Count(small);
    const Highlight lights = LightsOf(m_tones, kLowestLight);
    for (int32_t y = 0; y < small.GetHeight(); ++y) {
        kHighlightRow.For(frame.level.set)(m_result.data(), small.Row(y), width, lights);
        m_glow.TakeRow(y, m_result.data(), m_glowRows);
    }
    m_soft.Blur(softSigma);
    m_glow.Blur(glowSigma / static_cast<float>(1 << m_soft.GetBits()));

    const DreamyMix mix = {
        .soft = static_cast<uint16_t>(72 + degree * 7 / 4),
        .glow = static_cast<uint16_t>(72 + degree * 4),
        .depth = static_cast<uint16_t>(16 + degree),
    };
    for (int32_t y = 0; y < small.GetHeight(); ++y) {
        kDreamyVeilRow.For(frame.level.set)(small.Row(y), small.Row(y), m_glow.Row(y, m_glowRows),
                                            width, mix);
    }
}

void CDreamyFilter::Render(const StyleFrame& frame, uint32_t degree, const MaskShape& mask) {
    m_mask.Update(mask, frame.width, frame.height);
    if (m_mask.IsNothing()) {
        frame.Copy();
        return;
    }
    MakeVeil(frame, degree);
    const DreamyRow dreamy = kDreamyRow.For(frame.level.set);
    const auto width = static_cast<size_t>(frame.width);
    for (int32_t y = frame.firstRow; y < frame.height; y += frame.rowStep) {
        const uint8_t* source = frame.Load(y, m_source.data());
        uint8_t* target = frame.Target(y, m_result.data());
        const uint8_t* veil = m_soft.Row(y, m_softRows);
        if (m_mask.IsWhole()) {
            dreamy(target, source, veil, width);
        } else {
            dreamy(m_result.data(), source, veil, width);
            kMaskMixRow.For(frame.level.set)(target, source, m_result.data(), m_mask.Row(y), width);
        }
        frame.Store(y, target);
    }
}

} // namespace kyv
