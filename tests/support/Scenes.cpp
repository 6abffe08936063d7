// Scenes.
#include "tests/support/Scenes.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <numeric>

#include <gtest/gtest.h>

namespace kyvtest {
namespace {

uint32_t Below(Random& random, uint32_t count) {
    return static_cast<uint32_t>(random() % count);
}

float Between(Random& random, float minimum, float maximum) {
    return minimum + (maximum - minimum) * (static_cast<float>(random() >> 8) / 16777216.0F);
}

template <class T>
void Append(std::vector<uint8_t>& bytes, T value) {
    const auto* from = reinterpret_cast<const uint8_t*>(&value);
    bytes.insert(bytes.end(), from, from + sizeof value);
}

template <class T>
T ValueAt(const void* value) {
    T result;
    std::memcpy(&result, value, sizeof result);
    return result;
}

// Equal ends mean that the type is the range; 0 to 3 serves switches and choices alike.
template <class T>
T WholeBetween(Random& random, const ParamDescriptor& param) {
    const auto low = static_cast<int64_t>(ValueAt<T>(param.minimum));
    const auto high = static_cast<int64_t>(ValueAt<T>(param.maximum));
    return low < high ? static_cast<T>(low + random() % (high - low + 1))
                      : static_cast<T>(Below(random, param.type == ParamType_Bool ? 2 : 4));
}

} // namespace

std::vector<uint32_t> Seeds(uint32_t few, uint32_t many) {
    if (const char* one = std::getenv("KYV_SEED")) {
        return {static_cast<uint32_t>(std::strtoul(one, nullptr, 10))};
    }
    std::vector<uint32_t> seeds(std::getenv("KYV_LONG") ? many : few);
    std::iota(seeds.begin(), seeds.end(), 0U);
    return seeds;
}

uint32_t Slowness(const EffectDescriptor& effect) {
    return std::strcmp(effect.identifier, "Dsp_Vi_PencilSketch2") == 0 ? 12 : 1;
}

std::vector<uint8_t> RandomParams(const EffectDescriptor& effect, Random& random) {
    std::vector<uint8_t> bytes;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        const ParamDescriptor& param = effect.params[i];
        switch (param.type) {
        case ParamType_Float:
            Append(bytes,
                   Between(random, ValueAt<float>(param.minimum), ValueAt<float>(param.maximum)));
            break;
        case ParamType_Color:
            Append(bytes, static_cast<uint32_t>(random() & 0xFFFFFF));
            break;
        case ParamType_MaskRect:
        case ParamType_Position: {
            const bool none = random() % 3 == 0;
            for (uint32_t part = 0; part < param.valueSize / 4; ++part) {
                Append(bytes, none ? 0.0F : Between(random, -0.25F, 1.25F));
            }
            break;
        }
        default:
            if (param.valueSize == 1) {
                Append(bytes, WholeBetween<uint8_t>(random, param));
            } else {
                Append(bytes, WholeBetween<int32_t>(random, param));
            }
        }
    }
    return bytes;
}

Scene RandomScene(const EffectDescriptor& effect, uint32_t seed) {
    Random random(seed);
    Scene scene = {.effect = &effect, .seed = seed, .context = {}, .params = {}};
    EffectContext& context = scene.context;
    context.width = 1 + Below(random, 96);
    context.height = 1 + Below(random, 64);
    context.pixelFormat = Below(random, 2);
    context.stereoLayout = Below(random, 2) * Below(random, 3);
    context.fieldSelector = Below(random, 2) * Below(random, 3);
    if (random() % 2) {
        context.displayAspectX = 1 + Below(random, 20);
        context.displayAspectY = 1 + Below(random, 20);
    }
    context.duration = 200000000;
    context.position = static_cast<int64_t>(Below(random, 20000)) * 10000;
    context.preview = random() % 8 == 0;
    context.previewFraction = Between(random, 0.0F, 1.0F);
    context.threadCount = Below(random, 5);
    context.cpuLevel = static_cast<int32_t>(Below(random, 6));
    context.randomSeed = static_cast<uint32_t>(random());
    scene.params = RandomParams(effect, random);
    return scene;
}

size_t Scene::FramePixels() const {
    const bool stereo = context.stereoLayout == 1 || context.stereoLayout == 2;
    return size_t{context.width} * context.height * (stereo ? 2 : 1);
}

Frame Scene::Input(uint32_t index) const {
    return RandomFrame(FramePixels(), seed * 2 + index);
}

std::ostream& operator<<(std::ostream& stream, const Scene& scene) {
    const EffectContext& c = scene.context;
    return stream << scene.effect->identifier << ", seed " << scene.seed << ": " << c.width << " x "
                  << c.height << ", format " << c.pixelFormat << ", layout " << c.stereoLayout
                  << ", field " << c.fieldSelector << ", level " << c.cpuLevel << ", threads "
                  << c.threadCount << ", position " << c.position;
}

CSceneInstance::CSceneInstance(const Scene& scene)
    : CTestInstance(*scene.effect, scene.context.width, scene.context.height) {
    Apply(scene);
}

void CSceneInstance::Apply(const Scene& scene) {
    EffectContext context = scene.context;
    context.descriptor = scene.effect;
    context.instanceData = Context().instanceData;
    context.params = Context().params;
    Context() = context;
    Params().assign(scene.params.begin(), scene.params.end());
}

Frame RenderScene(const Scene& scene) {
    const Frame inputs[2] = {scene.Input(0), scene.Input(1)};
    Frame output(scene.FramePixels(), 0xA5A5A5A5);
    CSceneInstance instance(scene);
    EXPECT_EQ(instance.Begin(), KYV_OK) << scene;
    EXPECT_EQ(instance.Render(output.data(), inputs[0].data(), inputs[1].data()), KYV_OK) << scene;
    if (scene.seed % 2) { // the other half is released by DestroyInstance alone
        EXPECT_EQ(instance.End(), KYV_OK) << scene;
    }
    return output;
}

std::vector<const EffectDescriptor*> AllEffects() {
    std::vector<const EffectDescriptor*> effects;
    for (uint32_t i = 0; i < Module().effectCount; ++i) {
        effects.push_back(&Module().effects[i]);
    }
    return effects;
}

std::string EffectName(const EffectDescriptor& effect) {
    return effect.identifier;
}

} // namespace kyvtest
