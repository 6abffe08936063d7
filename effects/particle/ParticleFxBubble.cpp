// How bubbles move.
#include "effects/particle/ParticleFxBubble.h"

#include <algorithm>
#include <cmath>

#include "effects/particle/ParticleMath.h"

namespace kyv {
namespace {

// Sizes in pixels and speeds in pixels per ms of a canvas 720 pixels wide.
constexpr float kSmallest = 20.0F;
constexpr float kSizeSpan = 250.0F;
constexpr float kSlowestRise = -0.025F;
constexpr float kRiseRange = -0.03F;

// No bubble of a usual canvas is half as old when it leaves at the top. On one many times taller
// than wide a bubble may hardly move, or not at all in single precision, and must not stay forever.
constexpr int32_t kOldestMs = 600000;

// How long the slowest bubble needs, with room for the rounding of its steps.
int32_t LongestLifeMs(float canvasHeight, float largestSize, float scale) {
    const double way = double{canvasHeight} + double{largestSize};
    const double life = way / (double{-kSlowestRise} * scale) * 1.05 + 1000.0;
    return life < kOldestMs ? static_cast<int32_t>(life) : kOldestMs;
}

} // namespace

void CParticleFxBubble::SetMotion(const FrameSetup& setup) {
    const float s = setup.scale;
    if (m_emitter.bounds.width != setup.bounds.width ||
        m_emitter.bounds.bottom != setup.bounds.bottom) {
        ClearSnapshots();
    }
    SetEmitInterval(TruncateToInt((1.0F - setup.density) * 2700.0F + 300.0F));
    SetMaxParticles(-1);

    m_emitter.spawn = setup.spawn;
    m_emitter.bounds = setup.bounds;
    // A largest size below the smallest makes all bubbles the smallest.
    const float smallest = (setup.minSize * kSizeSpan + kSmallest) * s;
    const float largest = std::max(smallest, (setup.maxSize * kSizeSpan + kSmallest) * s);
    m_emitter.sizeBase = smallest;
    m_emitter.sizeRange = largest - smallest;
    m_nLargestSize = TruncateToInt(largest);

    m_emitter.vxBase = 0.0F;
    m_emitter.vxRange = 0.0F;
    m_emitter.vyBase = kSlowestRise * s;
    m_emitter.vyRange = kRiseRange * s;
    m_emitter.axBase = -0.00003F * s;
    m_emitter.axRange = 0.00006F * s;
    m_emitter.ayBase = 0.0F;
    m_emitter.ayRange = 0.0F;
    m_fSwayFactor = std::fabs(-0.01F * s);
    SetLongestLife(LongestLifeMs(setup.bounds.bottom, largest, s));
}

void CParticleFxBubble::SpawnParticle(int32_t) {
    if (!HasRoom(m_particles.size())) {
        return;
    }
    ParticleRecord bubble = SpawnFromEmitter(m_emitter, m_random);
    bubble.swayLimit = (m_random.Unit() + 3.0F) * m_fSwayFactor;
    m_particles.push_back(bubble);
}

void CParticleFxBubble::UpdateParticles(int32_t, int32_t deltaMs) {
    if (deltaMs == 0) {
        return;
    }
    const auto dt = static_cast<float>(deltaMs);
    for (ParticleRecord& bubble : m_particles) {
        // Too fast to a side turns the sideways push round: the bubble sways.
        if (bubble.vx > bubble.swayLimit || bubble.vx < -bubble.swayLimit) {
            bubble.ax = -bubble.ax;
        }
        bubble.vx += bubble.ax * dt;
        bubble.vy += bubble.ay * dt;
        bubble.x += bubble.vx * dt;
        bubble.y += bubble.vy * dt;
        bubble.angle += 0.04F * dt;
        if (bubble.angle >= 360.0F) {
            bubble.angle -= 360.0F;
        }
        bubble.ageMs += deltaMs;
    }
}

void CParticleFxBubble::RetireParticles() {
    std::erase_if(m_particles, [this](const ParticleRecord& bubble) {
        return !IsInBounds(bubble.x, bubble.y, bubble.size, m_emitter.bounds) ||
               bubble.ageMs >= kOldestMs;
    });
}

} // namespace kyv
