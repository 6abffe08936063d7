// The calling protocol, for all effects alike.
#include <array>
#include <set>
#include <string>

#include <gtest/gtest.h>

#include "tests/support/TestHost.h"

namespace {

using namespace kyvtest;

class Lifecycle : public testing::TestWithParam<uint32_t> {
protected:
    const EffectDescriptor& effect() const { return Module().effects[GetParam()]; }
};

INSTANTIATE_TEST_SUITE_P(AllEffects, Lifecycle, testing::Range(0U, Module().effectCount),
                         [](const auto& entry) {
                             return std::string(Module().effects[entry.param].identifier);
                         });

size_t ParamBytes(const EffectDescriptor& effect) {
    size_t bytes = 0;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        bytes += effect.params[i].valueSize;
    }
    return bytes;
}

TEST_P(Lifecycle, NullContextAndNullInstanceDataAreStatuses) {
    const EffectCallbacks& call = effect().callbacks;
    for (const EffectCallback callback :
         {call.InitInstance, call.DestroyInstance, call.ProcessFrame, call.BeginProcessing,
          call.EndProcessing}) {
        EXPECT_EQ(callback(nullptr), 0x80004005U);
    }
    EXPECT_EQ(call.SetInputFrame(0, nullptr), 0x80004005U);

    EffectContext context = {};
    context.descriptor = &effect();
    EXPECT_EQ(call.DestroyInstance(&context), 0U);
    EXPECT_EQ(call.EndProcessing(&context), 0U);
    EXPECT_EQ(call.SetInputFrame(0, &context), 0x80004005U);
    EXPECT_EQ(call.BeginProcessing(&context), 0x80004005U);
    EXPECT_EQ(call.ProcessFrame(&context), 0x80004005U);
    EXPECT_EQ(call.InitInstance(&context), 0x80004005U); // no parameter buffer
}

// A host object that notes what the parameter buffer held when it was notified.
struct Witness : HostNotification {
    HostNotificationTable operations = {[](HostNotification* self) {
        auto* witness = static_cast<Witness*>(self);
        ++witness->calls;
        witness->seen = *witness->watched;
    }};
    const uint8_t* watched = nullptr;
    uint8_t seen = 0;
    int calls = 0;
};

TEST_P(Lifecycle, InitInstanceNotifiesFirstAndWritesThePackedDefaultsOnly) {
    const size_t bytes = ParamBytes(effect());
    std::vector<uint8_t> buffer(bytes + 32, 0xA5);
    Witness witness;
    witness.table = &witness.operations;
    witness.watched = &buffer[16];

    EffectContext context = {};
    context.descriptor = &effect();
    context.notification = &witness;
    context.params = &buffer[16];
    ASSERT_EQ(effect().callbacks.InitInstance(&context), 0U);

    std::vector<uint8_t> expected(16, 0xA5);
    for (uint32_t i = 0; i < effect().paramCount; ++i) {
        const auto* value = static_cast<const uint8_t*>(effect().params[i].defaultValue);
        expected.insert(expected.end(), value, value + effect().params[i].valueSize);
    }
    expected.insert(expected.end(), 16, 0xA5);
    EXPECT_EQ(buffer, expected);
    EXPECT_EQ(witness.calls, 1);
    EXPECT_EQ(witness.seen, 0xA5);
}

TEST(InitInstance, PictureInPictureHas105ParameterBytes) {
    EXPECT_EQ(ParamBytes(Effect("Kyv_Dsp_Pi_Freeform")), 105U);
}

// An option beside the level changes nothing but what it is for, which takes larger frames; other
// upper bits are part of the level, as ever.
TEST_P(Lifecycle, LevelsHoldBesideAnOption) {
    constexpr uint32_t kWidth = 50, kHeight = 40;
    const Frame inputs[2] = {RandomFrame(kWidth * kHeight, 1), RandomFrame(kWidth * kHeight, 2)};
    const auto render = [&](int32_t level) {
        CTestInstance instance(effect(), kWidth, kHeight);
        instance.Context().cpuLevel = level;
        instance.Context().duration = int64_t{60} * 10'000'000;
        instance.Context().position = int64_t{20} * 10'000'000;
        EXPECT_EQ(instance.Begin(), 0U);
        Frame output(kWidth * kHeight);
        EXPECT_EQ(instance.Render(output.data(), inputs[0].data(), inputs[1].data()), 0U);
        return output;
    };
    for (const int32_t level : {0, 1, 3, 5}) {
        EXPECT_EQ(render(CpuLevelOption_WideMap + level), render(level)) << level;
    }
    EXPECT_EQ(render(0x4B580001), render(5));
    EXPECT_EQ(render(-1), render(0));
}

TEST_P(Lifecycle, SetInputFrameFillsTheLeadingPointers) {
    CTestInstance instance(effect(), 4, 4);
    std::array<void*, 4> frames;
    for (uint32_t i = 0; i < 4; ++i) {
        frames[i] = reinterpret_cast<void*>(uintptr_t{0x1000} * (i + 1));
    }
    auto* inputs = static_cast<void**>(instance.Context().instanceData);
    ASSERT_EQ(instance.SetInput(0, frames[0]), 0U);
    EXPECT_EQ(inputs[0], frames[0]);
    EXPECT_EQ(inputs[1], nullptr);
    ASSERT_EQ(instance.SetInput(1, frames[1]), 0U);
    ASSERT_EQ(instance.SetInput(5, frames[2]), 0U);
    const bool two = effect().properties.inputCount == 2;
    EXPECT_EQ(inputs[0], two ? frames[0] : frames[2]);
    EXPECT_EQ(inputs[1], two ? frames[2] : nullptr);
    inputs[0] = inputs[1] = nullptr;
}

TEST_P(Lifecycle, RequestFlagsAreSetByTheEffectsThatNeedThem) {
    CTestInstance instance(effect(), 4, 4);
    ASSERT_EQ(instance.Begin(), 0U);
    const std::set<std::string> settingA = {"Kyv_Dsp_Co_Temperature", "Kyv_Dsp_Co_WhiteBalance",
                                            "DSP_TR_TestAlpha", "DSP_TR_AlphaTransition"};
    const std::set<std::string> settingB = {
        "Kyv_Dsp_Co_Temperature", "Kyv_Dsp_Co_WhiteBalance", "Kyv_Dsp_Pfx_RefractiveBubble",
        "Kyv_Dsp_Pfx_Bubble",     "Kyv_Dsp_Pfx_Fireworks",   "Kyv_Dsp_Vi_LightRay"};
    EXPECT_EQ(instance.Context().requestA, settingA.count(effect().identifier));
    EXPECT_EQ(instance.Context().requestB, settingB.count(effect().identifier));
}

TEST_P(Lifecycle, AbsurdFrameSizesAreRefused) {
    const Frame input(16);
    Frame output(16, 3);
    for (const auto& [width, height] :
         {std::pair{0U, 4U}, {4U, 0U}, {0xFFFFFFFFU, 1U}, {1U, 0x80000000U}, {0U, 0U}}) {
        CTestInstance instance(effect(), width, height);
        instance.Begin();
        instance.Render(output.data(), input.data(), input.data());
        EXPECT_EQ(output, Frame(16, 3)) << width << " x " << height;
    }
}

} // namespace
