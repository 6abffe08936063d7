// Draws one sprite for many particles, shifted by their depth in stereo views.
#pragma once

#include <cstdint>

#include "effects/particle/ParticleRecord.h"
#include "effects/particle/StereoLibrary.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

class StereoSpriteLayer {
public:
    enum class Anchor : int32_t { Centre = 0, TopLeft = 1 };
    enum class Blend : int32_t {
        Alpha = KYVImageUtility::SpriteMode_AlphaBlend,
        Additive = KYVImageUtility::SpriteMode_AddBlend,
    };

    StereoSpriteLayer() = default;
    // With another stereo helper than the usual one.
    explicit StereoSpriteLayer(const NativeString& stereoLibrary) : m_stereo(stereoLibrary) {}

    // The image stays the caller's. The display's size is that of the whole picture, 0 when it is
    // unknown; only its ratio counts.
    void BindTarget(KYVImageUtility::CImageARGB& target, int32_t displayWidth,
                    int32_t displayHeight, StereoMode mode);
    // The sprite stays the caller's.
    void SetSprite(KYVImageUtility::CImageARGB& sprite) { m_pSprite = &sprite; }
    void SetAlpha(uint8_t alpha) { m_nAlpha = alpha; }
    void SetScale(float x, float y);
    void SetAnchor(Anchor anchor) { m_anchor = anchor; }
    void SetBlend(Blend blend) { m_blend = blend; }

    // Draws nothing in a mode that is none of mono, left and right view.
    void DrawParticle(const ParticleRecord& particle);

    // The shift of the right view, in pixels; the left one's is the opposite. 0 without the stereo
    // helper.
    float GetParallax(const ParticleRecord& particle) const {
        return m_stereo.GetParallax(particle.z);
    }

private:
    float m_fScaleX = 1.0F;
    float m_fScaleY = 1.0F;
    uint8_t m_nAlpha = 255;
    Blend m_blend = Blend::Alpha;
    Anchor m_anchor = Anchor::TopLeft;
    KYVImageUtility::CImageARGB* m_pSprite = nullptr;
    KYVImageUtility::CImageARGB* m_pTarget = nullptr;
    float m_fPixelAspect = 1.0F;
    StereoMode m_mode = StereoMode::Mono;
    CStereoLibrary m_stereo;
};

} // namespace kyv
