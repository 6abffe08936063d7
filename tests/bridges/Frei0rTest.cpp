// The frei0r plug-ins, against the module itself.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <limits>
#include <memory>
#include <set>
#include <thread>

#include <gmock/gmock.h>

#include "tests/bridges/Frei0rHost.h"
#include "tests/support/TestHost.h"

namespace {

using kyvtest::CFrei0rInstance;
using kyvtest::CFrei0rPlugin;
using kyvtest::CTestInstance;
using kyvtest::Frame;
using kyvtest::RandomFrame;

constexpr const char* kCornerPin = "kyv_corner_pin";

// The effect that a plug-in is made from.
const EffectDescriptor& EffectOf(const std::string& plugin) {
    static const std::pair<const char*, const char*> kEffects[] = {
        {"kyv_alpha_transition", "DSP_TR_AlphaTransition"},
        {"kyv_bubble", "Kyv_Dsp_Pfx_Bubble"},
        {"kyv_color_temperature", "Kyv_Dsp_Co_Temperature"},
        {kCornerPin, "Kyv_Dsp_Pi_Freeform"},
        {"kyv_dreamy", "Kyv_Dsp_Vi_Dreamy"},
        {"kyv_fireworks", "Kyv_Dsp_Pfx_Fireworks"},
        {"kyv_light_ray", "Kyv_Dsp_Vi_LightRay"},
        {"kyv_pencil_sketch", "Dsp_Vi_PencilSketch2"},
        {"kyv_picture_in_picture", "Kyv_Dsp_Pi_Freeform"},
        {"kyv_refractive_bubble", "Kyv_Dsp_Pfx_RefractiveBubble"},
        {"kyv_test_alpha_transition", "DSP_TR_TestAlpha"},
        {"kyv_water_ripple", "Kyv_Dsp_Pfx_WaterRipple"},
        {"kyv_white_balance", "Kyv_Dsp_Co_WhiteBalance"},
    };
    for (const auto& [name, effect] : kEffects) {
        if (plugin == name) {
            return kyvtest::Effect(effect);
        }
    }
    ADD_FAILURE() << "what is " << plugin << "?";
    std::abort();
}

// The frame as the module renders it for a host of its own.
Frame RenderByModule(CTestInstance& instance, double seconds, const Frame& a, const Frame& b) {
    Frame output(a.size(), 0xCDCDCDCD);
    instance.Context().cpuLevel = int32_t{CpuLevel_Avx2} | int32_t{CpuLevelOption_WideMap};
    instance.Context().position = static_cast<int64_t>(std::floor(seconds * 1e7));
    EXPECT_EQ(instance.Begin(), KYV_OK);
    EXPECT_EQ(instance.Render(output.data(), a.data(), b.data()), KYV_OK);
    return output;
}

// One of the record's values as a double that spans the range, or as it is.
double Unit(const ParamDescriptor& param, const void* value, size_t component) {
    const auto number = [&](const void* from) -> double {
        if (param.type == ParamType_Byte || param.valueSize == 1) {
            return *static_cast<const uint8_t*>(from);
        }
        if (param.type == ParamType_Choice || param.type == ParamType_Int ||
            param.type == ParamType_Bool) {
            int32_t whole;
            std::memcpy(&whole, from, sizeof whole);
            return whole;
        }
        float real;
        std::memcpy(&real, static_cast<const uint8_t*>(from) + 4 * component, sizeof real);
        return real;
    };
    const bool isPlain = param.type == ParamType_MaskRect || param.type == ParamType_Position ||
                         param.type == ParamType_Bool;
    const double least = isPlain ? 0 : number(param.minimum);
    const double most = isPlain ? 1 : number(param.maximum);
    const bool isComparison = std::strcmp(param.nameKey, "IDS_Co_Param_CompareImage_Name") == 0;
    return (number(value) - least) / (most - least) / (isComparison ? 2 : 1);
}

size_t Components(const ParamDescriptor& param) {
    return param.type == ParamType_MaskRect ? 4 : param.type == ParamType_Position ? 2 : 1;
}

TEST(Frei0rTest, EveryEffectHasItsPlugin) {
    std::set<const EffectDescriptor*> effects;
    std::set<std::string> names;
    for (const std::string& name : kyvtest::PluginNames()) {
        const CFrei0rPlugin plugin(name);
        effects.insert(&EffectOf(name));
        names.insert(plugin.Info().name);
        EXPECT_EQ(plugin.Info().frei0rVersion, 1);
        EXPECT_EQ(plugin.Info().colorModel, Frei0rColorModel_Bgra8888);
        EXPECT_EQ(plugin.IsMixer(),
                  EffectOf(name).properties.inputCount == 2 && name != kCornerPin);
        std::set<std::string> params;
        for (int i = 0; i < plugin.Info().paramCount; ++i) {
            params.insert(plugin.Param(i).name);
            EXPECT_NE(plugin.Param(i).type, -1);
            EXPECT_NE(plugin.Param(i).explanation, nullptr);
        }
        EXPECT_EQ(params.size(), static_cast<size_t>(plugin.Info().paramCount)) << name;
        EXPECT_EQ(plugin.Param(-1).name, nullptr);
        EXPECT_EQ(plugin.Param(plugin.Info().paramCount).name, nullptr);
    }
    EXPECT_EQ(effects.size(), kyvtest::Module().effectCount);
    EXPECT_EQ(names.size(), kyvtest::PluginNames().size());
}

// The parameters come in the module's order. Defaults, bounds and the three values that hosts keep
// for themselves all come back as they went in.
TEST(Frei0rTest, ValuesAreTheModules) {
    for (const std::string& name : kyvtest::PluginNames()) {
        if (name == kCornerPin) {
            continue;
        }
        const CFrei0rPlugin plugin(name);
        const EffectDescriptor& effect = EffectOf(name);
        CFrei0rInstance instance(plugin, 16, 16);
        int index = 0;
        for (uint32_t i = 0; i < effect.paramCount; ++i) {
            const ParamDescriptor& param = effect.params[i];
            SCOPED_TRACE(name + " " + param.key);
            if (param.control == ParamControl_DepthSlider) {
                continue; // there is no stereo
            }
            if (param.type == ParamType_Color) {
                const auto* color = static_cast<const uint8_t*>(param.defaultValue);
                const Frei0rColor read = instance.Color(index);
                EXPECT_EQ(read.r * 255, color[0]);
                EXPECT_EQ(read.g * 255, color[1]);
                EXPECT_EQ(read.b * 255, color[2]);
                EXPECT_EQ(plugin.Param(index).type, Frei0rParam_Color);
                ++index;
                continue;
            }
            for (size_t k = 0; k < Components(param); ++k, ++index) {
                EXPECT_EQ(instance.Get(index), Unit(param, param.defaultValue, k));
                for (const void* value :
                     {param.minimum, param.maximum, param.value4, param.value5, param.value6}) {
                    instance.Set(index, Unit(param, value, k));
                    EXPECT_EQ(instance.Get(index), Unit(param, value, k));
                }
                instance.Set(index, std::nan(""));
                EXPECT_EQ(instance.Get(index), Unit(param, param.defaultValue, k));
                if (plugin.Param(index).type == Frei0rParam_Double && Components(param) == 1) {
                    for (const double beyond : {1.5, 1e300}) {
                        instance.Set(index, beyond);
                        EXPECT_EQ(instance.Get(index), 1);
                        instance.Set(index, -beyond);
                        EXPECT_EQ(instance.Get(index), 0);
                    }
                }
            }
        }
        const bool isParticle = effect.properties.familyVariant == 4;
        EXPECT_EQ(index + isParticle, plugin.Info().paramCount);
    }
}

TEST(Frei0rTest, FramesAreTheModules) {
    constexpr std::pair<unsigned, unsigned> kSizes[] = {{1, 1}, {33, 17}, {4096, 8}, {160, 120}};
    for (const std::string& name : kyvtest::PluginNames()) {
        if (name == kCornerPin) {
            continue;
        }
        const CFrei0rPlugin plugin(name);
        for (const auto& [width, height] : kSizes) {
            SCOPED_TRACE(name + " " + std::to_string(width) + " x " + std::to_string(height));
            Frame a = RandomFrame(size_t{width} * height, 1);
            for (size_t i = 0; i < a.size() / 2; ++i) { // solid, as videos are
                a[i] |= 0xFF000000;
            }
            const Frame b = RandomFrame(a.size(), 2);
            CFrei0rInstance instance(plugin, width, height);
            CTestInstance own(EffectOf(name), width, height);
            Frame expected = RenderByModule(own, 2.5, a, b);
            if (name == "kyv_water_ripple") { // what it has for alpha depends on its fades
                for (size_t i = 0; i < a.size(); ++i) {
                    expected[i] = (expected[i] & 0xFFFFFF) | (a[i] & 0xFF000000);
                }
            }
            EXPECT_EQ(instance.Update(2.5, a, b), expected);
            // A host may work in place.
            Frame inPlace = a;
            if (plugin.IsMixer()) {
                plugin.update2(instance.Handle(), 2.5, inPlace.data(), b.data(), nullptr,
                               inPlace.data());
            } else {
                plugin.update(instance.Handle(), 2.5, inPlace.data(), inPlace.data());
            }
            EXPECT_EQ(inPlace, expected);
        }
    }
}

TEST(Frei0rTest, ChangedValuesReachTheEffect) {
    const Frame a = RandomFrame(64 * 48, 3), b = RandomFrame(64 * 48, 4);
    const CFrei0rPlugin dreamy("kyv_dreamy");
    CFrei0rInstance bridged(dreamy, 64, 48);
    bridged.Set("Degree", 11.0 / 39); // 1 to 40: 12
    bridged.Set("Mask right", 0.5);
    bridged.Set("Mask bottom", 0.75);
    bridged.Set("Mask shape", 1);
    bridged.Set("Mask softness", 0.5); // 0 to 0.4
    bridged.Set("Invert mask", 1);
    CTestInstance own(EffectOf("kyv_dreamy"), 64, 48);
    own.Set("P1", uint8_t{12});
    own.Set("P2", std::array{0.0F, 0.0F, 0.5F, 0.75F});
    own.Set("P3", 1);
    own.Set("P4", 0.2F);
    own.Set("P5", 1);
    EXPECT_EQ(bridged.Update(0, a, b), RenderByModule(own, 0, a, b));

    const CFrei0rPlugin wipe("kyv_alpha_transition");
    CFrei0rInstance wiping(wipe, 64, 48);
    wiping.Set("Percentage", 0.625);
    wiping.Set("Smoothness", 0.25);
    wiping.Set("Border", 1);
    wiping.Set(wipe.IndexOf("Border color"), Frei0rColor{1, 0.2F, 0});
    CTestInstance ownWipe(EffectOf("kyv_alpha_transition"), 64, 48);
    ownWipe.Set("P1", 0.625F);
    ownWipe.Set("P2", 10);
    ownWipe.Set("P3", 0x0033FFU); // red in the lowest byte
    ownWipe.Set("P4", uint8_t{1});
    EXPECT_EQ(wiping.Update(0, a, b), RenderByModule(ownWipe, 0, a, b));

    // The clip's length brings the fades; a second of ten is within the first.
    const CFrei0rPlugin bubble("kyv_bubble");
    CFrei0rInstance rising(bubble, 64, 48);
    rising.Set("Clip length", 10.0 / 3600);
    CTestInstance ownRising(EffectOf("kyv_bubble"), 64, 48);
    ownRising.Context().duration = 100'000'000;
    EXPECT_EQ(rising.Update(9.5, a, b), RenderByModule(ownRising, 9.5, a, b));
}

TEST(Frei0rTest, NeutralSettingsAndTheEndsOfWipesAreExact) {
    const Frame a = RandomFrame(37 * 29, 5), b = RandomFrame(37 * 29, 6);
    for (const char* name : {"kyv_color_temperature", "kyv_white_balance", kCornerPin}) {
        const CFrei0rPlugin plugin(name);
        EXPECT_EQ(CFrei0rInstance(plugin, 37, 29).Update(1, a, b), a) << name;
    }
    for (const char* name : {"kyv_alpha_transition", "kyv_test_alpha_transition"}) {
        const CFrei0rPlugin plugin(name);
        CFrei0rInstance instance(plugin, 37, 29);
        for (const double smoothness : {0.0, 0.5, 1.0}) {
            instance.Set("Smoothness", smoothness);
            instance.Set("Percentage", 0);
            EXPECT_EQ(instance.Update(1, a, b), a);
            instance.Set("Percentage", 1);
            EXPECT_EQ(instance.Update(1, a, b), b);
        }
    }
}

TEST(Frei0rTest, CornerPinLeavesTheOutsideTransparent) {
    const unsigned width = 80, height = 60;
    Frame solid = RandomFrame(width * height, 7);
    for (uint32_t& pixel : solid) {
        pixel |= 0xFF000000;
    }
    const CFrei0rPlugin plugin(kCornerPin);
    CFrei0rInstance instance(plugin, width, height);
    instance.Set("Corner A X", 0.25);
    instance.Set("Corner D X", 0.25); // columns 20 to 79
    instance.Set(plugin.IndexOf("Background color"), Frei0rColor{0, 1, 0});
    const Frame pinned = instance.Update(0, solid, {});
    // Over black, which the module keeps opaque: the same colours where there is a picture.
    CTestInstance own(EffectOf(kCornerPin), width, height);
    const float corners[] = {0.25F, 0, 1, 0, 1, 1, 0.25F, 1};
    for (int i = 0; i < 8; ++i) {
        own.Set(("P" + std::to_string(i)).c_str(), corners[i]);
    }
    for (const char* key : {"P8", "P15", "P23"}) {
        own.Set(key, 0);
    }
    const Frame black(solid.size(), 0xFF000000);
    const Frame expected = RenderByModule(own, 0, black, solid);
    for (size_t i = 0; i < solid.size(); ++i) {
        // The last column and row have no neighbour to sample, so the module leaves them out.
        const unsigned x = i % width, y = static_cast<unsigned>(i / width);
        if (x < 20) {
            ASSERT_EQ(pinned[i], 0x0000FF00U) << x << "," << y;
        } else if (x < width - 2 && y < height - 2) {
            ASSERT_EQ(pinned[i], expected[i]) << x << "," << y;
        }
    }

    // A solid background is the module's own rendering.
    instance.Set("Background opacity", 1);
    const Frame green(solid.size(), 0xFF00FF00);
    EXPECT_EQ(instance.Update(0, solid, {}), RenderByModule(own, 0, green, solid));

    // The input's alpha goes along: a half transparent picture stays half transparent.
    instance.Set("Background opacity", 0);
    const Frame half(solid.size(), 0x80204060);
    const uint32_t inside = instance.Update(0, half, {})[30 * width + 50];
    EXPECT_EQ(inside >> 24, 0x80U);
    EXPECT_NEAR(inside >> 16 & 255, 0x20, 1);
    EXPECT_NEAR(inside & 255, 0x60, 1);
}

// Whatever a host hands over, a frame comes out and nothing else is touched.
TEST(Frei0rTest, HostileCallsDoNoHarm) {
    const double numbers[] = {std::nan(""),
                              std::numeric_limits<double>::infinity(),
                              -std::numeric_limits<double>::infinity(),
                              1e300,
                              -1e300,
                              7.5,
                              -3,
                              1e-320};
    const Frame a = RandomFrame(33 * 17, 8), b = RandomFrame(33 * 17, 9);
    for (const std::string& name : kyvtest::PluginNames()) {
        SCOPED_TRACE(name);
        const CFrei0rPlugin plugin(name);
        plugin.deinit(); // not begun yet
        for (const auto& [width, height] :
             {std::pair(0U, 5U), {5U, 0U}, {~0U, ~0U}, {1U << 16, 1U << 16}}) {
            EXPECT_EQ(plugin.construct(width, height), nullptr);
        }
        plugin.destruct(nullptr);
        double value = 0;
        plugin.setParam(nullptr, &value, 0);
        plugin.update(nullptr, 0, a.data(), nullptr);
        plugin.destruct(plugin.construct(640, 480)); // never rendered

        CFrei0rInstance instance(plugin, 33, 17);
        plugin.setParam(instance.Handle(), &value, -1);
        plugin.setParam(instance.Handle(), &value, plugin.Info().paramCount);
        plugin.setParam(instance.Handle(), nullptr, 0);
        plugin.update(instance.Handle(), 0, nullptr, nullptr);
        for (const double number : numbers) {
            for (int i = 0; i < plugin.Info().paramCount; ++i) {
                const float part = static_cast<float>(std::clamp(number, -1e38, 1e38));
                plugin.Param(i).type == Frei0rParam_Color
                    ? instance.Set(i, Frei0rColor{part, part, part})
                    : instance.Set(i, number);
            }
            EXPECT_NE(instance.Update(number, a, b), Frame(a.size(), 0xCDCDCDCD));
        }
        // A picture without a time, as libavfilter has it.
        CFrei0rInstance still(plugin, 33, 17), first(plugin, 33, 17);
        EXPECT_EQ(still.Update(-368934881474191032320.0, a, b), first.Update(0, a, b));
        plugin.deinit(); // with instances alive
    }
}

// Frames dealt to instances in any order, as melt does, and several effects at once.
TEST(Frei0rTest, ThreadsSeeTheSameFrames) {
    constexpr int kFrames = 6;
    const Frame a = RandomFrame(64 * 48, 10), b = RandomFrame(64 * 48, 11);
    std::vector<std::thread> threads;
    for (const std::string& name : kyvtest::PluginNames()) {
        threads.emplace_back([&, name] {
            const CFrei0rPlugin plugin(name);
            CFrei0rInstance played(plugin, 64, 48);
            if (name == kCornerPin) {
                played.Set("Corner A X", 0.3);
            }
            std::vector<Frame> expected;
            for (int i = 0; i < kFrames; ++i) {
                expected.push_back(played.Update(i / 25.0, a, b));
            }
            std::vector<std::thread> renderers;
            for (int first = 0; first < 3; ++first) {
                renderers.emplace_back([&, first] {
                    CFrei0rInstance dealt(plugin, 64, 48);
                    if (name == kCornerPin) {
                        dealt.Set("Corner A X", 0.3);
                    }
                    for (int i = kFrames - 1 - first; i >= 0; i -= 3) {
                        EXPECT_EQ(dealt.Update(i / 25.0, a, b), expected[i]) << name << i;
                    }
                });
            }
            for (std::thread& thread : renderers) {
                thread.join();
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

// Bands: one instance, several threads, values changing meanwhile.
TEST(Frei0rTest, BandsOfOneInstanceWaitForEachOther) {
    const CFrei0rPlugin plugin("kyv_color_temperature");
    CFrei0rInstance instance(plugin, 64, 12);
    CFrei0rInstance alone(plugin, 64, 12);
    instance.Set("Degree", 0.8);
    alone.Set("Degree", 0.8);
    const Frame a = RandomFrame(64 * 12, 12);
    const Frame expected = alone.Update(0, a, a);
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < 20; ++round) {
                instance.Set("Degree", 0.8);
                EXPECT_EQ(instance.Update(round / 25.0, a, a), expected);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

} // namespace
