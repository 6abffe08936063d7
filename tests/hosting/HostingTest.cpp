// What hosts share: an instance's calling order and values as numbers.
#include <cmath>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "hosting/Error.h"
#include "hosting/Instance.h"
#include "hosting/Names.h"
#include "hosting/Values.h"
#include "tests/support/TestHost.h"

namespace {

using kyvhosting::CInstance;
using testing::ElementsAre;

// An effect that writes down its calls; the statuses are what the test wants them to be.
std::vector<std::string> g_calls;
KyvStatus g_initStatus, g_beginStatus, g_inputStatus;

KyvStatus Init(EffectContext* context) noexcept {
    g_calls.emplace_back("init");
    std::memset(context->params, 0x11, 5);
    return g_initStatus;
}
KyvStatus Begin(EffectContext*) noexcept {
    g_calls.emplace_back("begin");
    return g_beginStatus;
}
KyvStatus Input(uint32_t index, EffectContext* context) noexcept {
    g_calls.push_back("input " + std::to_string(index) + static_cast<char*>(context->frame));
    return g_inputStatus;
}
KyvStatus Process(EffectContext* context) noexcept {
    g_calls.push_back(std::string("process ") + static_cast<char*>(context->frame));
    return KYV_OK;
}
KyvStatus End(EffectContext*) noexcept {
    g_calls.emplace_back("end");
    return KYV_OK;
}
KyvStatus Destroy(EffectContext*) noexcept {
    g_calls.emplace_back("destroy");
    return KYV_OK;
}

class InstanceTest : public testing::Test {
protected:
    InstanceTest() {
        g_calls.clear();
        g_initStatus = g_beginStatus = g_inputStatus = KYV_OK;
        m_params[0].key = "P1";
        m_params[0].type = ParamType_Byte;
        m_params[0].valueSize = 1;
        m_params[1].key = "P2";
        m_params[1].type = ParamType_Int;
        m_params[1].valueSize = 4;
        m_effect.identifier = "Probe";
        m_effect.paramCount = 2;
        m_effect.params = m_params;
        m_effect.properties.inputCount = 2;
        m_effect.callbacks = {Init, Destroy, Input, Process, nullptr, Begin, End, nullptr, nullptr};
    }

    ParamDescriptor m_params[2] = {};
    EffectDescriptor m_effect = {};
};

TEST_F(InstanceTest, GivesBackWhatItBeganAndNothingElse) {
    { const CInstance untouched(m_effect); }
    EXPECT_THAT(g_calls, ElementsAre());
    {
        CInstance instance(m_effect);
        instance.Init();
        g_beginStatus = KYV_FAIL;
        EXPECT_EQ(instance.Begin(), KYV_FAIL); // may have allocated something on the way
    }
    EXPECT_THAT(g_calls, ElementsAre("init", "begin", "end", "destroy"));
    g_calls.clear();
    {
        CInstance instance(m_effect);
        instance.Init();
        instance.Begin();
        instance.End();
        instance.Destroy();
    }
    EXPECT_THAT(g_calls, ElementsAre("init", "begin", "end", "destroy"));
}

TEST_F(InstanceTest, RendersFromBothInputsUpToTheFirstFailure) {
    CInstance instance(m_effect);
    char a[] = "a", b[] = "b", out[] = "out";
    EXPECT_EQ(instance.Render(out, a, b), KYV_OK);
    EXPECT_THAT(g_calls, ElementsAre("input 0a", "input 1b", "process out"));
    g_calls.clear();
    g_inputStatus = KYV_OUT_OF_MEMORY;
    EXPECT_EQ(instance.Render(out, a, b), KYV_OUT_OF_MEMORY);
    EXPECT_THAT(g_calls, ElementsAre("input 0a"));
    EXPECT_THROW(
        try {
            kyvhosting::Require(g_inputStatus, m_effect, "SetInputFrame");
        } catch (const kyvhosting::CCallError& error) {
            EXPECT_EQ(error.Status(), KYV_OUT_OF_MEMORY);
            EXPECT_STREQ(error.what(), "Probe: SetInputFrame failed with status 0x8007000E");
            throw;
        },
        kyvhosting::CError);
}

TEST_F(InstanceTest, ValuesLieInTableOrderWithoutGaps) {
    CInstance instance(m_effect);
    EXPECT_TRUE(instance.Set("P2", int32_t{0x04030201}));
    EXPECT_TRUE(instance.Set("P1", uint8_t{9}));
    EXPECT_FALSE(instance.Set("P1", int32_t{7})); // four bytes are not one
    EXPECT_FALSE(instance.Set("P3", int32_t{7}));
    EXPECT_THAT(instance.Params(), ElementsAre(9, 1, 2, 3, 4));
    EXPECT_EQ(instance.IndexOf("P2"), 1U);
    EXPECT_EQ(instance.Context().params, instance.Params().data());
}

// Every parameter of the module, so that a type that is new is covered at once.
TEST(ValuesTest, NumbersOfEveryParameterGoInAndOut) {
    for (uint32_t i = 0; i < kyvtest::Module().effectCount; ++i) {
        const EffectDescriptor& effect = kyvtest::Module().effects[i];
        for (uint32_t j = 0; j < effect.paramCount; ++j) {
            const ParamDescriptor& param = effect.params[j];
            SCOPED_TRACE(std::string(effect.identifier) + " " + param.key);
            std::vector<uint8_t> value(param.valueSize, 0);
            const size_t count = kyvhosting::ComponentCount(param);
            ASSERT_GE(count, 1U);
            const kyvhosting::NumberRange range = kyvhosting::RangeOf(param);
            for (size_t k = 0; k < count; ++k) {
                const double plain = kyvhosting::ComponentOf(param, param.defaultValue, k);
                const auto after = [&](double number) {
                    kyvhosting::SetComponent(param, value.data(), k, number);
                    return kyvhosting::ComponentOf(param, value.data(), k);
                };
                EXPECT_EQ(after(1e300), range.most);
                EXPECT_EQ(after(-1e300), range.least);
                EXPECT_EQ(after(std::nan("")), plain);
                EXPECT_EQ(after(range.least), range.least);
                EXPECT_EQ(after(std::numeric_limits<double>::infinity()), plain);
            }
            EXPECT_EQ(std::memcmp(value.data(), param.defaultValue, param.valueSize), 0);
        }
    }
}

TEST(ValuesTest, WholeNumbersRoundAndColoursStartWithRed) {
    const EffectDescriptor& pip = kyvtest::Effect("Kyv_Dsp_Pi_Freeform");
    const ParamDescriptor& key = pip.params[9]; // 0xFF00FF
    uint8_t color[4] = {1, 2, 3, 0};
    kyvhosting::SetComponent(key, color, 0, 200.5);
    kyvhosting::SetComponent(key, color, 2, 17.4);
    EXPECT_THAT(color, ElementsAre(201, 2, 17, 0));
    uint8_t tolerance = 0; // 0 to 127
    kyvhosting::SetComponent(pip.params[10], &tolerance, 0, 128);
    EXPECT_EQ(tolerance, 127);
    // The comparison's third mode; a switch of a transition has none.
    const ParamDescriptor& compare = kyvtest::Effect("Kyv_Dsp_Co_WhiteBalance").params[1];
    EXPECT_EQ(kyvhosting::RangeOf(compare).most, 2);
    EXPECT_EQ(kyvhosting::RangeOf(kyvtest::Effect("DSP_TR_TestAlpha").params[3]).most, 1);
}

} // namespace
