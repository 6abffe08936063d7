// Any moment of any clip: times that no host means, far jumps, and walks that last for hours.
#include <algorithm>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/platform/ProcessUse.h"
#include "tests/support/Scenes.h"

namespace {

using namespace kyvtest;

constexpr int64_t kSecond = 10000000;
constexpr int64_t kHour = 3600 * kSecond;
constexpr int64_t kLeast = std::numeric_limits<int64_t>::min();
constexpr int64_t kMost = std::numeric_limits<int64_t>::max();

class Times : public testing::TestWithParam<const EffectDescriptor*> {
protected:
    // All that can be in the air is there: every parameter at its maximum.
    Scene Densest(uint32_t width, uint32_t height) const {
        Scene scene = {.effect = GetParam(), .seed = 1, .context = {}, .params = {}};
        scene.context.width = width;
        scene.context.height = height;
        scene.context.cpuLevel = 5;
        scene.context.threadCount = 2;
        for (uint32_t i = 0; i < GetParam()->paramCount; ++i) {
            const ParamDescriptor& param = GetParam()->params[i];
            const auto* most = static_cast<const uint8_t*>(param.maximum);
            scene.params.insert(scene.params.end(), most, most + param.valueSize);
        }
        return scene;
    }
};

INSTANTIATE_TEST_SUITE_P(AllEffects, Times, testing::ValuesIn(AllEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

TEST_P(Times, OfEveryKindAreServedAndForgotten) {
    Scene scene = Densest(40, 30);
    scene.context.position = kSecond;
    scene.context.duration = 10 * kSecond;
    const Frame expected = RenderScene(scene);
    const Frame inputs[2] = {scene.Input(0), scene.Input(1)};
    Frame output(expected.size());
    CSceneInstance instance(scene);
    ASSERT_EQ(instance.Begin(), KYV_OK);
    for (const int64_t position : {kLeast, -kHour, int64_t{-1}, int64_t{0}, int64_t{1}, kHour,
                                   kSecond * 214748, kSecond * 214749, kMost}) {
        for (const int64_t duration :
             {kLeast, int64_t{-1}, int64_t{0}, int64_t{1}, kSecond, 2 * kHour, kMost}) {
            instance.Context().position = position;
            instance.Context().duration = duration;
            ASSERT_EQ(instance.Render(output.data(), inputs[0].data(), inputs[1].data()), KYV_OK)
                << position << " of " << duration;
        }
    }
    instance.Apply(scene);
    ASSERT_EQ(instance.Render(output.data(), inputs[0].data(), inputs[1].data()), KYV_OK);
    EXPECT_EQ(output, expected);
}

// The effects that keep what they simulated, for going back.
class LongWalk : public Times {};

std::vector<const EffectDescriptor*> ParticleEffects() {
    std::vector<const EffectDescriptor*> effects = AllEffects();
    std::erase_if(effects, [](const EffectDescriptor* effect) {
        return std::strcmp(effect->subclass, "DSP_SUBCLASS_V_EF_PARTICLE") != 0;
    });
    return effects;
}

INSTANTIATE_TEST_SUITE_P(ParticleEffects, LongWalk, testing::ValuesIn(ParticleEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

TEST_P(LongWalk, OfAnHourHoldsLittle) {
    const Scene scene = Densest(640, 360);
    const Frame input = scene.Input(0);
    Frame output(input.size());
    CSceneInstance instance(scene);
    const int64_t before = GetProcessUse().memoryBytes;
    ASSERT_EQ(instance.Begin(), KYV_OK);
    int64_t most = 0;
    // Every state that is kept on the way is reached: one in 3.3 s.
    for (int64_t at = 0; at <= kHour; at += 33 * kSecond / 10) {
        instance.Context().position = at;
        ASSERT_EQ(instance.Render(output.data(), input.data()), KYV_OK);
        most = std::max(most, GetProcessUse().memoryBytes - before);
    }
    // 16 MiB of states and what is in the air; the aim is 64.
    EXPECT_LT(most, (int64_t{32} << 20) + GetProcessUse().noiseBytes);
    RecordProperty("KiB", std::to_string(most >> 10));
}

} // namespace
