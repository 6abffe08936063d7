// Renders that tests repeat in other circumstances: everything that decides their bytes, drawn from
// a seed, with every parameter within its declared range.
#pragma once

#include <cstdint>
#include <ostream>
#include <random>
#include <string>
#include <vector>

#include "interface/HostInterface.h"
#include "tests/support/TestHost.h"

namespace kyvtest {

using Random = std::mt19937;

// The seeds of a random test: a few, or many when KYV_LONG is in the environment, or the one in
// KYV_SEED, which repeats a failure.
std::vector<uint32_t> Seeds(uint32_t few, uint32_t many);

struct Scene {
    const EffectDescriptor* effect;
    uint32_t seed;         // names the scene, and draws its input frames
    EffectContext context; // the fields that describe the call; pointers stay null
    std::vector<uint8_t> params;

    // Of a frame; a frame of two views is twice as wide.
    size_t FramePixels() const;
    Frame Input(uint32_t index) const;
};

// Up to 96 x 64 pixels, any format, layout and field, a moment within a clip of 20 s.
Scene RandomScene(const EffectDescriptor& effect, uint32_t seed);

// Names what a failure needs to be repeated.
std::ostream& operator<<(std::ostream& stream, const Scene& scene);

// How many times as long as the others' an instance's first frame takes: the pencil sketch draws
// all its marks then, which short runs cannot afford thousands of times.
uint32_t Slowness(const EffectDescriptor& effect);

// A parameter buffer with values of the declared ranges.
std::vector<uint8_t> RandomParams(const EffectDescriptor& effect, Random& random);

// An instance with the scene's context and parameters, not prepared.
class CSceneInstance : public CTestInstance {
public:
    explicit CSceneInstance(const Scene& scene);
    // Another moment, size or set of parameters for the same instance.
    void Apply(const Scene& scene);
};

// What a fresh instance gives, on a frame that was filled with 0xA5 before.
Frame RenderScene(const Scene& scene);

// Every effect of the module, for parameterised suites, and the name of each.
std::vector<const EffectDescriptor*> AllEffects();
std::string EffectName(const EffectDescriptor& effect);

} // namespace kyvtest
