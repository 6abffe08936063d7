// A particle, and how one is born from an emitter.
#pragma once

#include <cstdint>

#include "effects/particle/ParticleRandom.h"

namespace kyv {

// Positions and sizes are in canvas pixels, y growing downward; speeds in pixels per ms.
struct ParticleRecord {
    float x;
    float y;
    float z; // depth for the stereo library
    float startX;
    float startY;
    float vx;
    float vy;
    float startVx;
    float startVy;
    float ax; // pixels per ms squared
    float ay;
    float angle; // degrees, 0 at birth
    int32_t ageMs;
    float size; // diameter
    int32_t alpha;
    float swayLimit; // the sideways speed at which a bubble turns round
};
static_assert(sizeof(ParticleRecord) == 64);

// The part of the canvas outside which particles die.
struct ParticleBounds {
    float left;
    float top;
    float width;
    float bottom;
};

// Where particles are born. A range is what a random number of 0 to 1 is multiplied by.
struct SpawnArea {
    float x;
    float y;
    float z;
    float xRange;
    float yRange;
};

struct EmitterSpec {
    float sizeBase;
    float sizeRange;
    float vxBase;
    float vyBase;
    float vxRange;
    float vyRange;
    float axRange;
    float ayRange;
    SpawnArea spawn;
    ParticleBounds bounds;
    float axBase;
    float ayBase;
};

// Draws seven random numbers, always in the same order: x, y, vx, vy, ax, ay, size. Places are
// whole pixels.
ParticleRecord SpawnFromEmitter(const EmitterSpec& emitter, CParticleRandom& random);

// True while a particle with its top left corner at (x, y) can be seen. A part of a pixel of size
// does not count.
bool IsInBounds(float x, float y, float size, const ParticleBounds& bounds);

} // namespace kyv
