// A host may have its processor set to anything when it calls: the bytes are the same, and the host
// finds its settings as they were.
#include <gtest/gtest.h>

#include "tests/support/Scenes.h"
#include "threading/ThreadPool.h"

#if defined(__x86_64__)

namespace {

using namespace kyvtest;

struct HostState {
    const char* name;
    uint32_t control;    // of the vector unit, with its exception flags
    uint16_t oldControl; // of the old unit
    bool backward;       // string instructions
};

constexpr HostState kUsual = {"as usual", 0x1F80, 0x037F, false};
constexpr HostState kStates[] = {
    {"rounds down", 0x3F80, 0x077F, false},
    {"rounds up", 0x5F80, 0x0B7F, false},
    {"rounds to zero", 0x7F80, 0x0F7F, false},
    {"traps", 0x0000, 0x0340, false},
    {"traps and rounds up", 0x4000, 0x0B40, false},
    {"takes denormals for zero", 0x9FC0, 0x037F, false},
    {"old unit in single precision", 0x1F80, 0x007F, false},
    {"flags raised", 0x1FBF, 0x037F, false},
    {"strings run backward", 0x1F80, 0x037F, true},
};

// Runs a callback in a state. What it left behind is in the state that comes back; its name is that
// of what was run.
template <class Call>
HostState RunIn(const HostState& state, const char* name, Call&& call) {
    HostState after = {name, 0, 0, false};
    uint64_t flags = 0;
    __asm__ volatile("fninit\n\tfldcw %0" : : "m"(state.oldControl));
    __builtin_ia32_ldmxcsr(state.control);
    if (state.backward) {
        __asm__ volatile("std" : : : "cc", "memory");
    }
    call();
    flags = __builtin_ia32_readeflags_u64();
    __asm__ volatile("cld" : : : "cc", "memory");
    after.control = __builtin_ia32_stmxcsr();
    __asm__ volatile("fnstcw %0" : "=m"(after.oldControl));
    __builtin_ia32_ldmxcsr(kUsual.control);
    __asm__ volatile("fninit\n\tfldcw %0" : : "m"(kUsual.oldControl));
    after.backward = (flags & 0x400) != 0;
    return after;
}

class HostStates : public testing::TestWithParam<const EffectDescriptor*> {};

INSTANTIATE_TEST_SUITE_P(AllEffects, HostStates, testing::ValuesIn(AllEffects()),
                         [](const auto& entry) { return EffectName(*entry.param); });

TEST_P(HostStates, DecideNoByteAndStay) {
    for (const uint32_t seed : Seeds(8, 100)) {
        const Scene scene = RandomScene(*GetParam(), seed);
        const Frame inputs[2] = {scene.Input(0), scene.Input(1)};
        const Frame expected = RenderScene(scene);
        for (const HostState& state : kStates) {
            SCOPED_TRACE(state.name);
            Frame output(expected.size(), 0xA5A5A5A5);
            KyvStatus status[4] = {1, 1, 1, 1};
            CSceneInstance instance(scene);
            const HostState after[] = {
                RunIn(state, "BeginProcessing", [&] { status[0] = instance.Begin(); }),
                RunIn(state, "SetInputFrame",
                      [&] {
                          status[1] = instance.SetInput(0, inputs[0].data());
                          instance.SetInput(scene.effect->properties.inputCount - 1,
                                            inputs[scene.effect->properties.inputCount - 1].data());
                      }),
                RunIn(state, "ProcessFrame", [&] { status[2] = instance.Process(output.data()); }),
                RunIn(state, "EndProcessing", [&] { status[3] = instance.End(); }),
            };
            for (int i = 0; i < 4; ++i) {
                ASSERT_EQ(status[i], KYV_OK) << after[i].name << ", " << scene;
                ASSERT_EQ(after[i].control, state.control) << after[i].name << ", " << scene;
                ASSERT_EQ(after[i].oldControl, state.oldControl) << after[i].name << ", " << scene;
                ASSERT_EQ(after[i].backward, state.backward) << after[i].name << ", " << scene;
            }
            ASSERT_EQ(output, expected) << scene;
        }
    }
}

// The two that ended the process when divisions by zero and invalid operations trap.
TEST(HostStates, TrapsDoNotFireWhereTheyOnceDid) {
    Scene line = RandomScene(Effect("Kyv_Dsp_Pi_Freeform"), 1);
    line.context.width = 9;
    line.context.height = 1;
    line.context.cpuLevel = 0;
    Scene lens = RandomScene(Effect("Kyv_Dsp_Pfx_RefractiveBubble"), 2);
    lens.context.width = 84;
    lens.context.height = 35;
    lens.context.displayAspectX = 16;
    lens.context.displayAspectY = 480;
    lens.context.stereoLayout = 0;
    lens.context.preview = 0;
    for (const Scene& scene : {line, lens}) {
        const Frame inputs[2] = {scene.Input(0), scene.Input(1)};
        Frame output(scene.FramePixels());
        CSceneInstance instance(scene);
        ASSERT_EQ(instance.Begin(), KYV_OK);
        for (int second = 0; second < 30; ++second) {
            instance.Context().position = second * int64_t{10000000};
            KyvStatus status = 1;
            RunIn({"traps", 0x0000, 0x0340, false}, "", [&] {
                status = instance.Render(output.data(), inputs[0].data(), inputs[1].data());
            });
            ASSERT_EQ(status, KYV_OK) << scene;
        }
    }
}

TEST(HostStates, DoNotReachTheWorkers) {
    uint32_t seen = 0;
    kyv::CThreadPool pool;
    RunIn({"rounds up and traps", 0x4000, 0x0B40, false}, "", [&] {
        uint32_t id = 0;
        uint32_t result = 0;
        pool.QueueJob(
            [](void* argument) -> uint32_t {
                *static_cast<uint32_t*>(argument) = __builtin_ia32_stmxcsr();
                return 0;
            },
            &seen, &id);
        pool.WaitJob(id, kyv::kInfinite, &result);
    });
    EXPECT_EQ(seen & ~0x3FU, kUsual.control);
}

} // namespace
#endif
