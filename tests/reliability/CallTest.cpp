// Calls in any order and number: random sequences, thousands of lives, many instances at once.
#include <algorithm>
#include <cstdlib>
#include <memory>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "tests/platform/GuardedMemory.h"
#include "tests/platform/ProcessUse.h"
#include "tests/support/Scenes.h"

namespace {

using namespace kyvtest;

class Calls : public testing::TestWithParam<const EffectDescriptor*> {};

INSTANTIATE_TEST_SUITE_P(AllEffects, Calls, testing::ValuesIn(AllEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

KyvStatus AnyCall(const EffectCallbacks& callbacks, EffectContext& context, Random& random) {
    switch (random() % 8) {
    case 0:
        return callbacks.BeginProcessing(&context);
    case 1:
        return callbacks.EndProcessing(&context);
    case 2:
        return callbacks.DestroyInstance(&context);
    case 3:
        return callbacks.InitInstance(&context);
    case 4:
    case 5:
        return callbacks.SetInputFrame(static_cast<uint32_t>(random() % 3), &context);
    default:
        return callbacks.ProcessFrame(&context);
    }
}

// Twenty calls, most of them out of turn, with a size, format and layout of their own each, and now
// and then without something that a call needs.
TEST_P(Calls, InRandomOrderReturnAStatusAndStayInTheFrame) {
    for (const uint32_t seed : Seeds(KYV_SEQUENCES / Slowness(*GetParam()), 84000)) {
        Random random(seed);
        const auto one = [&](uint32_t in) { return random() % in == 0; };
        CSceneInstance instance(RandomScene(*GetParam(), seed));
        std::vector<std::unique_ptr<CGuardedMemory>> frames; // the module keeps their addresses
        EffectContext& context = instance.Context();
        for (int call = 0; call < 20; ++call) {
            if (one(3)) {
                instance.Apply(RandomScene(*GetParam(), static_cast<uint32_t>(random())));
                frames.clear();
                for (uint32_t index = 0; index < 2; ++index) {
                    instance.SetInput(index, nullptr); // those of another size are gone
                }
            }
            const EffectContext whole = context;
            if (one(16)) {
                context.params = nullptr;
            }
            if (one(16)) {
                context.descriptor = nullptr;
            }
            if (one(32)) {
                context.instanceData = nullptr;
            }
            const size_t pixels = size_t{context.width} * context.height *
                                  (context.stereoLayout == 1 || context.stereoLayout == 2 ? 2 : 1);
            frames.push_back(std::make_unique<CGuardedMemory>(pixels * 4, random() % 16));
            context.frame = one(8) ? nullptr : frames.back()->Data();
            const KyvStatus status = AnyCall(GetParam()->callbacks, context, random);
            ASSERT_TRUE(status == KYV_OK || status == KYV_FAIL) << "run " << seed;
            context.params = whole.params;
            context.descriptor = whole.descriptor;
            context.instanceData = whole.instanceData;
            for (const auto& frame : frames) {
                ASSERT_TRUE(frame->IsIntact()) << "run " << seed;
            }
        }
    }
}

// Thread counts beyond a processor's, formats and layouts change from life to life.
TEST_P(Calls, OfManyLivesLeaveNothing) {
    const auto live = [&](uint32_t lives) {
        for (uint32_t seed = 0; seed < lives; ++seed) {
            RenderScene(RandomScene(*GetParam(), seed % 50));
        }
    };
    live(50 / Slowness(*GetParam())); // what is made once is made
    const ProcessUse before = GetProcessUse();
    live(std::getenv("KYV_LONG") ? 5000 : KYV_LIVES / Slowness(*GetParam()));
    EXPECT_TRUE(ThreadsComeDownTo(before.threads));
    const ProcessUse after = GetProcessUse();
    EXPECT_LE(after.handles, before.handles + 8); // the system's own come and go
    if (!KYV_OWN_ALLOCATOR) {
        EXPECT_LE(after.memoryBytes, before.memoryBytes + after.noiseBytes);
    }
}

// Every effect, and free-form with each of them: it keeps most from frame to frame.
TEST(Calls, OnManyThreadsGiveWhatEachGivesAlone) {
    std::vector<Scene> scenes;
    for (const uint32_t seed : Seeds(2, 40)) {
        for (const EffectDescriptor* effect : AllEffects()) {
            scenes.push_back(RandomScene(*effect, seed));
            scenes.push_back(RandomScene(Effect("Kyv_Dsp_Pi_Freeform"), seed + scenes.size()));
            scenes.back().context.cpuLevel = static_cast<int32_t>(scenes.size() % 2 * 5);
        }
    }
    std::vector<Frame> alone;
    for (const Scene& scene : scenes) {
        alone.push_back(RenderScene(scene));
    }
    std::vector<Frame> together(scenes.size());
    constexpr size_t kThreads = 8;
    std::vector<std::thread> threads;
    for (size_t first = 0; first < kThreads; ++first) {
        threads.emplace_back([&, first] {
            for (size_t i = first; i < scenes.size(); i += kThreads) {
                together[i] = RenderScene(scenes[i]);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    for (size_t i = 0; i < scenes.size(); ++i) {
        EXPECT_EQ(together[i], alone[i]) << scenes[i];
    }
}

} // namespace
