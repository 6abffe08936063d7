// Births and the test of who is still there.
#include "effects/particle/ParticleRecord.h"

#include "effects/particle/ParticleMath.h"
#include "platform/WrapMath.h"

namespace kyv {
namespace {

// A whole pixel between base and base + range.
float Place(float base, float range, float r) {
    const int32_t low = TruncateToInt(base);
    const int32_t high = TruncateToInt(base + range);
    return static_cast<float>(
        WrapAdd(low, TruncateToInt(static_cast<float>(WrapAdd(high, -low)) * r)));
}

} // namespace

ParticleRecord SpawnFromEmitter(const EmitterSpec& emitter, CParticleRandom& random) {
    ParticleRecord particle = {};
    particle.x = Place(emitter.spawn.x, emitter.spawn.xRange, random.Unit());
    particle.startX = particle.x;
    particle.y = Place(emitter.spawn.y, emitter.spawn.yRange, random.Unit());
    particle.startY = particle.y;
    particle.z = emitter.spawn.z;
    particle.vx = emitter.vxBase + random.Unit() * emitter.vxRange;
    particle.startVx = particle.vx;
    particle.vy = emitter.vyBase + random.Unit() * emitter.vyRange;
    particle.startVy = particle.vy;
    particle.ax = emitter.axBase + random.Unit() * emitter.axRange;
    particle.ay = emitter.ayBase + random.Unit() * emitter.ayRange;
    particle.size = emitter.sizeBase + random.Unit() * emitter.sizeRange;
    particle.alpha = 255;
    return particle;
}

bool IsInBounds(float x, float y, float size, const ParticleBounds& bounds) {
    const float s = TruncateToFloat(size);
    return x + s > bounds.left && bounds.left + bounds.width > x && y + s > bounds.top &&
           y < bounds.bottom;
}

} // namespace kyv
