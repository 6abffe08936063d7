// Where a particle's sprite goes.
#include "effects/particle/StereoSpriteLayer.h"

#include "effects/particle/ParticleMath.h"

namespace kyv {

void StereoSpriteLayer::BindTarget(KYVImageUtility::CImageARGB& target, int32_t displayWidth,
                                   int32_t displayHeight, StereoMode mode) {
    m_pTarget = &target;
    m_mode = mode;
    const int32_t width = target.GetWidth();
    const int32_t height = target.GetHeight();
    const bool isKnown = displayWidth > 0 && displayHeight > 0;
    if (mode != StereoMode::Mono) {
        const StereoViewInfo view = {
            .displayAspectWidth = isKnown ? displayWidth : width,
            .displayAspectHeight = isKnown ? displayHeight : height,
            .imageWidth = width,
            .imageHeight = height,
            .imagePitchBytes = target.GetPitch(),
        };
        m_stereo.Configure(view);
    }
    m_fPixelAspect = PixelAspect(width, height, displayWidth, displayHeight);
    if (isKnown && mode == StereoMode::HalfWidth) {
        m_fPixelAspect /= 2.0F;
    }
}

void StereoSpriteLayer::SetScale(float x, float y) {
    m_fScaleX = x;
    m_fScaleY = y;
}

void StereoSpriteLayer::DrawParticle(const ParticleRecord& particle) {
    if (!m_pTarget || !m_pSprite) {
        return;
    }
    const float w = particle.size * m_fScaleX;
    const float h = particle.size * m_fScaleY * m_fPixelAspect;
    float x = particle.x;
    float y = particle.y;
    if (m_anchor != Anchor::TopLeft) {
        x -= w / 2.0F;
        y -= h / 2.0F;
    }
    switch (m_mode) {
    case StereoMode::Mono:
        break;
    case StereoMode::LeftView:
        x -= GetParallax(particle);
        break;
    case StereoMode::RightView:
        x += GetParallax(particle);
        break;
    default:
        return;
    }
    m_pTarget->DrawSprite(*m_pSprite, static_cast<int32_t>(m_blend), x, y, w, h,
                          static_cast<uint8_t>(m_nAlpha * particle.alpha >> 8));
}

} // namespace kyv
