// How sparks look.
#include <algorithm>
#include <cmath>

#include "effects/particle/GlowSprite.h"
#include "effects/particle/ParticleFxFireworks.h"
#include "effects/particle/ParticleMath.h"

namespace kyv {
namespace {

using KYVImageUtility::CImageARGB;

constexpr int32_t kSmallestGlow = 2;

// Larger sparks, of canvases many thousand pixels wide, are scaled up from this.
constexpr int32_t kLargestGlow = 256;

} // namespace

CImageARGB& CParticleFxFireworks::GlowOfSize(int32_t size) {
    const auto [place, isNew] = m_glows.try_emplace(size);
    CImageARGB& glow = place->second;
    if (!glow.GetBuffer()) {
        DrawGlow(glow, size);
    }
    glow.TakeCpuLevel(*m_pCanvas);
    return glow;
}

void CParticleFxFireworks::RenderParticles() {
    float shift = m_mode == StereoMode::Mono ? 0.0F : m_stereo.GetParallax(m_emitter.spawn.z);
    if (std::isnan(shift)) {
        return; // as sprites are not drawn at such a place
    }
    if (m_mode == StereoMode::LeftView) {
        shift = -shift;
    }
    for (const Spark& spark : m_particles) {
        DrawSpark(spark, shift);
    }
}

void CParticleFxFireworks::DrawSpark(const Spark& spark, float shift) {
    const auto opacity = static_cast<uint8_t>(spark.alpha * GetFadeOutAlpha() >> 8);
    const int32_t size = std::max(TruncateToInt(spark.size), kSmallestGlow);
    const float half = static_cast<float>(size) / 2.0F;
    const float left = std::floor(spark.x + shift - half);
    const float top = std::floor(spark.y - half);
    CImageARGB& glow = GlowOfSize(std::min(size, kLargestGlow));
    glow.FillColor(spark.red, spark.green, spark.blue);
    if (size > kLargestGlow) {
        const auto length = static_cast<float>(size);
        m_pCanvas->DrawSprite(glow, KYVImageUtility::SpriteMode_AddBlend, left, top, length, length,
                              opacity);
        return;
    }
    const int32_t x = TruncateToInt(left);
    const int32_t y = TruncateToInt(top);
    CImageARGB view;
    if (m_pCanvas->GetSubImage(view, x, y, size, size) == 0) {
        return;
    }
    CImageARGB part;
    glow.GetSubImage(part, std::max(-x, 0), std::max(-y, 0), view.GetWidth(), view.GetHeight());
    view.TakeCpuLevel(*m_pCanvas);
    view.AddBlend(part, opacity);
}

} // namespace kyv
