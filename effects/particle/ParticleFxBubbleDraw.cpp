// How bubbles look.
#include "effects/particle/ParticleFxBubble.h"

#include <cstdint>

#include "effects/particle/ParticleMath.h"
#include "platform/WrapMath.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;
using KYVImageUtility::ResizeMode_Bilinear;

// How much wider than the bubble the area is that a lens shows, and how far that area begins left
// of and above the bubble. The second is three steps of single precision above the nearest value to
// 0.1: it decides the truncation at sizes of whole pixels.
constexpr float kLensSize = 1.2F;
constexpr float kLensMargin = 0.10000002384185791F; // 0x3DCCCCD0

struct Rect {
    int32_t x;
    int32_t y;
    int32_t w;
    int32_t h;
};

// The part of a picture inside a rectangle; empty when there is none.
void TakePart(CImageARGB& part, const CImageARGB& picture, const Rect& rect) {
    if (picture.GetSubImage(part, rect.x, rect.y, rect.w, rect.h) == 0) {
        part.Attach(nullptr, 0, 0, 0);
    }
}

// Where the visible part of a box lies in the scratch picture, which stands for the whole box.
int32_t VisibleStart(int32_t position, int32_t scratchLength, float boxLength) {
    return position < 0 ? TruncateToInt(-static_cast<float>(position) *
                                        static_cast<float>(scratchLength) / boxLength)
                        : 0;
}

int32_t VisibleLength(int32_t visible, int32_t scratchLength, float boxLength) {
    return TruncateToInt(static_cast<float>(scratchLength) / boxLength *
                         static_cast<float>(visible));
}

} // namespace

void CParticleFxBubble::SetFrame(const FrameSetup& setup, StereoMode mode) {
    SetMotion(setup);
    m_mode = mode;
    m_pSource = setup.source;
    m_pCanvas = setup.canvas;
    m_pMask = setup.mask;
    m_bRefractive = setup.isRefractive;
    m_nDisplayWidth = setup.displayWidth;
    m_nDisplayHeight = setup.displayHeight;

    if (!m_scratch.GetBuffer()) {
        m_scratch.Create(setup.body->GetWidth(), setup.body->GetHeight());
        m_scratch.FillBytes(0);
    }
    m_scratch.TakeCpuLevel(*m_pCanvas);
    m_pictureLayer.SetSprite(m_scratch);
    m_pictureLayer.BindTarget(*m_pCanvas, m_nDisplayWidth, m_nDisplayHeight, mode);
    m_bodyLayer.SetSprite(*setup.body);
    m_bodyLayer.BindTarget(*m_pCanvas, m_nDisplayWidth, m_nDisplayHeight, mode);
    for (StereoSpriteLayer* layer : {&m_pictureLayer, &m_bodyLayer}) {
        layer->SetAnchor(StereoSpriteLayer::Anchor::TopLeft);
        layer->SetBlend(StereoSpriteLayer::Blend::Alpha);
    }
}

void CParticleFxBubble::RenderParticles() {
    // The closing fade alone; bubbles need no opening one, they rise into the picture.
    m_pictureLayer.SetAlpha(GetFadeOutAlpha());
    m_bodyLayer.SetAlpha(GetFadeOutAlpha());
    if (m_particles.empty()) {
        return;
    }
    if (m_bRefractive) {
        RenderLenses();
    } else {
        RenderMiniatures();
    }
}

void CParticleFxBubble::RenderMiniatures() {
    // A scene too small to be scaled leaves the bubbles empty.
    if (!m_pSource->TryResize(m_scratch, ResizeMode_Bilinear)) {
        m_scratch.FillBytes(0);
    } else {
        m_scratch.CopyAlphaFrom(*m_pMask);
    }
    for (const ParticleRecord& bubble : m_particles) {
        m_bodyLayer.DrawParticle(bubble);
        m_pictureLayer.DrawParticle(bubble);
    }
}

void CParticleFxBubble::RenderLenses() {
    // What one bubble leaves here another at an edge may show, but never what an earlier frame
    // left.
    m_scratch.FillBytes(0);
    const float aspect = PixelAspect(m_pCanvas->GetWidth(), m_pCanvas->GetHeight(), m_nDisplayWidth,
                                     m_nDisplayHeight);
    for (const ParticleRecord& bubble : m_particles) {
        if (RefractInto(m_scratch, bubble, aspect)) {
            m_scratch.CopyAlphaFrom(*m_pMask);
            m_pictureLayer.DrawParticle(bubble);
        }
        m_bodyLayer.DrawParticle(bubble);
    }
}

// Writes what the lens of a bubble shows: an area larger than the bubble, squeezed into it. The
// canvas holds the bubbles drawn before, so bubbles refract each other. At the canvas's edge the
// part of the bubble outside keeps what the scratch held before: the previous bubble's picture.
// False when too little is inside.
bool CParticleFxBubble::RefractInto(CImageARGB& scratch, const ParticleRecord& bubble,
                                    float aspect) {
    Rect box = {TruncateToInt(bubble.x), TruncateToInt(bubble.y), TruncateToInt(bubble.size),
                TruncateToInt(bubble.size * aspect)};
    if (m_mode == StereoMode::LeftView) {
        box.x = TruncateToInt(static_cast<float>(box.x) - m_bodyLayer.GetParallax(bubble));
    } else if (m_mode == StereoMode::RightView) {
        box.x = TruncateToInt(static_cast<float>(box.x) + m_bodyLayer.GetParallax(bubble));
    }
    const auto w = static_cast<float>(box.w);
    const auto h = static_cast<float>(box.h);
    const Rect lens = {WrapSub(box.x, TruncateToInt(kLensMargin * w)),
                       WrapSub(box.y, TruncateToInt(kLensMargin * h)), TruncateToInt(kLensSize * w),
                       TruncateToInt(kLensSize * h)};
    CImageARGB behind;
    TakePart(behind, *m_pCanvas, lens);
    behind.TakeCpuLevel(*m_pCanvas);
    if (behind.GetWidth() == lens.w && behind.GetHeight() == lens.h) {
        return behind.TryResize(scratch, ResizeMode_Bilinear);
    }

    CImageARGB visible;
    TakePart(visible, *m_pCanvas, box);
    CImageARGB part;
    TakePart(part, scratch,
             {VisibleStart(box.x, scratch.GetWidth(), w),
              VisibleStart(box.y, scratch.GetHeight(), h),
              VisibleLength(visible.GetWidth(), scratch.GetWidth(), w),
              VisibleLength(visible.GetHeight(), scratch.GetHeight(), h)});
    return behind.TryResize(part, ResizeMode_Bilinear);
}

} // namespace kyv
