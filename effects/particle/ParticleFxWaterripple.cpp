// How ripples spread.
#include "effects/particle/ParticleFxWaterripple.h"

#include "effects/particle/ParticleMath.h"

namespace kyv {
namespace {

// At birth, on a canvas 720 pixels wide.
constexpr float kWavelength = 16.0F;
constexpr float kAmplitude = 30.0F;
constexpr float kRadius = 100.0F;

// The amplitude is gone after 5000 ms.
constexpr int32_t kLongestLifeMs = 5200;

} // namespace

void CParticleFxWaterripple::SetFrame(const FrameSetup& setup) {
    SetEmitInterval(TruncateToInt((1.0F - setup.density) * 1000.0F + 500.0F));
    SetMaxParticles(-1);
    SetLongestLife(kLongestLifeMs);
    m_pCanvas = setup.canvas;
    if (m_nWidth != setup.canvas->GetWidth() || m_nHeight != setup.canvas->GetHeight()) {
        ClearSnapshots();
        m_nWidth = setup.canvas->GetWidth();
        m_nHeight = setup.canvas->GetHeight();
    }
    if (!m_sheen.GetBuffer()) {
        KYVImageUtility::CImageARGB sheen; // kept once it is whole
        sheen.Create(m_nWidth, m_nHeight);
        if (!setup.sheen->TryResize(sheen, KYVImageUtility::ResizeMode_Bilinear)) {
            sheen.FillBytes(0); // too small to be scaled
        }
        m_sheen.Swap(sheen);
    }
    m_fScale = setup.scale;
}

void CParticleFxWaterripple::SpawnParticle(int32_t timeMs) {
    if (!HasRoom(m_particles.size())) {
        return;
    }
    // None that the closing fade would cut off at once.
    if (m_nDurationMs > 0 && int64_t{timeMs} + m_nFadeMs > m_nDurationMs) {
        return;
    }
    Ripple ripple;
    ripple.x = m_random.Unit() * static_cast<float>(m_nWidth);
    ripple.y = m_random.Unit() * static_cast<float>(m_nHeight);
    ripple.wavelength = kWavelength * m_fScale;
    ripple.amplitude = kAmplitude * m_fScale;
    ripple.radius = kRadius * m_fScale;
    ripple.phase = 0.0F;
    m_particles.push_back(ripple);
}

void CParticleFxWaterripple::UpdateParticles(int32_t, int32_t deltaMs) {
    if (deltaMs == 0) {
        return;
    }
    const auto dt = static_cast<float>(deltaMs);
    for (Ripple& ripple : m_particles) {
        ripple.phase -= 0.005F * dt;
        ripple.amplitude -= m_fScale * (0.006F * dt);
        ripple.radius += m_fScale * (0.04F * dt);
        ripple.wavelength += m_fScale * (dt * 0.004F);
    }
}

void CParticleFxWaterripple::RetireParticles() {
    std::erase_if(m_particles, [](const Ripple& ripple) { return ripple.amplitude <= 0.0F; });
}

} // namespace kyv
