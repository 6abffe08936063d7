// A sheen of water over the picture, and circular ripples that bend it, spread and die away.
#pragma once

#include <cstdint>

#include "effects/particle/ParticleFxBase.h"
#include "imageutility/ImageUtility.h"

namespace kyv {

// In canvas pixels; the phase in radians.
struct Ripple {
    float x;
    float y;
    float wavelength;
    float amplitude;
    float radius;
    float phase;
};

class CParticleFxWaterripple : public CParticleFx<Ripple> {
public:
    struct FrameSetup {
        // B, G, R, A; both stay the caller's. The canvas holds the scene and is used until the
        // picture is drawn; the sheen is needed at the first SetFrame alone.
        KYVImageUtility::CImageARGB* canvas;
        const KYVImageUtility::CImageARGB* sheen;
        float scale;   // canvas width / 720
        float density; // 0..1
    };

    // To be called before AdvanceTo. Another canvas size than before is another animation; the
    // sheen keeps the size of the first canvas, and only what it covers is water.
    void SetFrame(const FrameSetup& setup);

    void SpawnParticle(int32_t timeMs) override;
    void UpdateParticles(int32_t timeMs, int32_t deltaMs) override;
    void RetireParticles() override;
    void RenderParticles() override;

private:
    KYVImageUtility::CImageARGB* m_pCanvas = nullptr;
    KYVImageUtility::CImageARGB m_sheen; // at the first canvas's size
    int32_t m_nWidth = 0;                // of the canvas
    int32_t m_nHeight = 0;
    float m_fScale = 1.0F;
};

} // namespace kyv
