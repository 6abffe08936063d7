// bridge_bench: what a bridge adds to a frame. The module called directly and through its plug-in,
// in turns in one process, on frames of 1920x1080 at the best level and one thread.
#include <algorithm>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <string>
#include <vector>

#include "bridges/frei0r/Frei0r.h"
#include "hosting/Error.h"
#include "hosting/Instance.h"
#include "hosting/Plugin.h"
#include "tests/bridges/Frei0rHost.h"
#include "tests/support/TestHost.h"

namespace {

using kyvtest::CFrei0rInstance;
using kyvtest::CFrei0rPlugin;
using kyvtest::Frame;

struct Case {
    const char* plugin;
    const char* effect;
};

constexpr Case kCases[] = {
    {"kyv_color_temperature", "Kyv_Dsp_Co_Temperature"},
    {"kyv_white_balance", "Kyv_Dsp_Co_WhiteBalance"},
    {"kyv_dreamy", "Kyv_Dsp_Vi_Dreamy"},
    {"kyv_light_ray", "Kyv_Dsp_Vi_LightRay"},
    {"kyv_pencil_sketch", "Dsp_Vi_PencilSketch2"},
    {"kyv_bubble", "Kyv_Dsp_Pfx_Bubble"},
    {"kyv_refractive_bubble", "Kyv_Dsp_Pfx_RefractiveBubble"},
    {"kyv_fireworks", "Kyv_Dsp_Pfx_Fireworks"},
    {"kyv_water_ripple", "Kyv_Dsp_Pfx_WaterRipple"},
    {"kyv_picture_in_picture", "Kyv_Dsp_Pi_Freeform"},
    {"kyv_alpha_transition", "DSP_TR_AlphaTransition"},
    {"kyv_test_alpha_transition", "DSP_TR_TestAlpha"},
};

// The processor's time, so that what else the machine runs counts little.
template <class Run>
double Microseconds(int calls, Run&& run) {
    const std::clock_t start = std::clock();
    for (int i = 0; i < calls; ++i) {
        run();
    }
    return static_cast<double>(std::clock() - start) * 1e6 / CLOCKS_PER_SEC / calls;
}

// Sets every value before each frame, as the hosts that animate do.
void Update(const CFrei0rPlugin& plugin, CFrei0rInstance& instance,
            const std::vector<Frei0rColor>& colors, const std::vector<double>& numbers,
            double seconds, const Frame& a, const Frame& b, Frame& output) {
    for (int i = 0; i < plugin.Info().paramCount; ++i) {
        if (plugin.Param(i).type == Frei0rParam_Color) {
            instance.Set(i, colors[static_cast<size_t>(i)]);
        } else {
            instance.Set(i, numbers[static_cast<size_t>(i)]);
        }
    }
    if (plugin.IsMixer()) {
        plugin.update2(instance.Handle(), seconds, a.data(), b.data(), nullptr, output.data());
    } else {
        plugin.update(instance.Handle(), seconds, a.data(), output.data());
    }
}

// As from a video.
Frame SolidFrame(size_t pixels, uint32_t seed) {
    Frame frame = kyvtest::RandomFrame(pixels, seed);
    for (uint32_t& pixel : frame) {
        pixel |= 0xFF000000;
    }
    return frame;
}

struct Times {
    double direct = 1e300, again = 1e300, bridged = 1e300; // microseconds, the least of all rounds

    double Added() const { return bridged - direct; }
    double Noise() const { return again - direct; } // of two instances that are the same
};

void Prepare(kyvhosting::CInstance& instance, uint32_t width, uint32_t height) {
    const EffectDescriptor& effect = instance.Effect();
    EffectContext& context = instance.Context();
    context.width = width;
    context.height = height;
    context.cpuLevel = kyvhosting::kPluginCpuLevel;
    kyvhosting::Require(instance.Init(), effect, "InitInstance");
    if (effect.params[0].type == ParamType_Color) {
        instance.Set("P1", uint32_t{0x80C0FF});
    } else if (effect.properties.isTransition || effect.properties.family == EffectFamily_Color) {
        instance.Set("P1", 0.5F);
    }
    kyvhosting::Require(instance.Begin(), effect, "BeginProcessing");
}

Times Measure(const Case& what, uint32_t width, uint32_t height, int rounds, int calls) {
    const Frame a = SolidFrame(size_t{width} * height, 1);
    const Frame b = SolidFrame(a.size(), 2);
    Frame output(a.size());
    kyvhosting::CInstance direct(kyvtest::Effect(what.effect)), again(direct.Effect());
    const CFrei0rPlugin plugin(what.plugin);
    CFrei0rInstance bridged(plugin, width, height);
    for (kyvhosting::CInstance* instance : {&direct, &again}) {
        Prepare(*instance, width, height);
    }
    // Nothing is neutral or an end of a wipe, which the bridge would copy.
    if (direct.Effect().properties.isTransition) {
        bridged.Set(0, 0.5);
    } else if (plugin.Param(0).type == Frei0rParam_Color) {
        bridged.Set(0, Frei0rColor{1, 0xC0 / 255.0F, 0x80 / 255.0F});
    } else if (direct.Effect().properties.family == EffectFamily_Color) {
        bridged.Set(0, 0.75); // -1 to 1
    }
    std::vector<double> numbers;
    std::vector<Frei0rColor> colors;
    for (int i = 0; i < plugin.Info().paramCount; ++i) {
        const bool isColor = plugin.Param(i).type == Frei0rParam_Color;
        numbers.push_back(isColor ? 0 : bridged.Get(i));
        colors.push_back(isColor ? bridged.Color(i) : Frei0rColor{});
    }
    // The same moment again and again, in turns: both do the same work in every round, and the
    // least time is the one without what else the machine does.
    constexpr double kSeconds = 20;
    const auto run = [&](kyvhosting::CInstance& instance) {
        return [&] {
            instance.Context().position = static_cast<int64_t>(kSeconds * 1e7);
            kyvhosting::Require(instance.Render(output.data(), a.data(), b.data()),
                                instance.Effect(), "ProcessFrame");
        };
    };
    const auto runBridged = [&] {
        Update(plugin, bridged, colors, numbers, kSeconds, a, b, output);
    };
    Times times;
    for (int round = 0; round < rounds; ++round) {
        times.direct = std::min(times.direct, Microseconds(calls, run(direct)));
        times.again = std::min(times.again, Microseconds(calls, run(again)));
        times.bridged = std::min(times.bridged, Microseconds(calls, runBridged));
    }
    return times;
}

double MemcpyTime(size_t pixels) {
    const Frame source = kyvtest::RandomFrame(pixels, 3);
    Frame target(pixels);
    double least = 1e300;
    for (int round = 0; round < 100; ++round) {
        least = std::min(least, Microseconds(1, [&] {
                             std::memcpy(target.data(), source.data(),
                                         target.size() * sizeof target[0]);
                         }));
    }
    return least;
}

} // namespace

int main() {
    try {
        constexpr uint32_t kWidth = 1920, kHeight = 1080;
        const double copy = MemcpyTime(size_t{kWidth} * kHeight);
        std::printf("memcpy of a frame: %.0f us\n%-26s %10s %10s %9s %12s %9s %12s\n", copy, "",
                    "module, us", "bridge, us", "added, us", "% of memcpy", "noise, %",
                    "added, 1 x 1");
        for (const Case& what : kCases) {
            const Times times = Measure(what, kWidth, kHeight, 60, 1);
            const Times call = Measure(what, 1, 1, 20, 1000); // what does not depend on the size
            std::printf("%-26s %10.0f %10.0f %9.1f %12.1f %9.1f %12.2f\n", what.plugin,
                        times.direct, times.bridged, times.Added(), 100 * times.Added() / copy,
                        100 * times.Noise() / copy, call.Added());
            std::fflush(stdout);
        }
    } catch (const std::exception& error) {
        std::fprintf(stderr, "bridge_bench: %s\n", error.what());
        return 1;
    }
    return 0;
}
