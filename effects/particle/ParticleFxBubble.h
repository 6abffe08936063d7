// Soap bubbles that rise from the bottom edge, sway and leave at the top. Each shows a small
// picture of the whole scene, or refracts what lies behind it.
#pragma once

#include <cstdint>

#include "effects/particle/ParticleFxBase.h"
#include "effects/particle/ParticleRecord.h"
#include "effects/particle/StereoSpriteLayer.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

class CParticleFxBubble : public CParticleFx<ParticleRecord> {
public:
    struct FrameSetup {
        float density; // 0..1, as are the sizes
        float minSize;
        float maxSize;
        bool isRefractive;
        int32_t displayWidth; // 0 unknown
        int32_t displayHeight;
        float scale; // canvas width / 720
        SpawnArea spawn;
        ParticleBounds bounds;
        // All of the pixel format of the frame; they stay the caller's and are used until the
        // picture is drawn. The source may have another size than the canvas.
        KYVImageUtility::CImageARGB* canvas;
        const KYVImageUtility::CImageARGB* source;
        KYVImageUtility::CImageARGB* body;
        const KYVImageUtility::CImageARGB* mask; // only its alpha is used
    };

    // To be called before AdvanceTo. Another canvas size than before is another animation.
    void SetFrame(const FrameSetup& setup, StereoMode mode);

    void SpawnParticle(int32_t timeMs) override;
    void UpdateParticles(int32_t timeMs, int32_t deltaMs) override;
    void RetireParticles() override;
    void RenderParticles() override;

private:
    void SetMotion(const FrameSetup& setup);
    void RenderMiniatures();
    void RenderLenses();
    bool RefractInto(KYVImageUtility::CImageARGB& scratch, const ParticleRecord& bubble,
                     float aspect);

    StereoMode m_mode = StereoMode::Mono;
    int32_t m_nDisplayWidth = 0;
    int32_t m_nDisplayHeight = 0;
    EmitterSpec m_emitter = {};
    const KYVImageUtility::CImageARGB* m_pSource = nullptr;
    KYVImageUtility::CImageARGB* m_pCanvas = nullptr;
    const KYVImageUtility::CImageARGB* m_pMask = nullptr;
    KYVImageUtility::CImageARGB m_scratch; // the picture within a bubble
    StereoSpriteLayer m_pictureLayer;
    StereoSpriteLayer m_bodyLayer;
    float m_fSwayFactor = 0.0F;
    bool m_bRefractive = false;
    int32_t m_nLargestSize = 0;
};

} // namespace kyv
