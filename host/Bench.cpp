// Timing of effects.
#include "host/Bench.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <functional>
#include <memory>
#include <random>
#include <utility>

#include <nlohmann/json.hpp>

#include "host/Clip.h"
#include "host/Hosting.h"
#include "hosting/Names.h"

namespace kyvhost {
namespace {

using Clock = std::chrono::steady_clock;
using json = nlohmann::ordered_json;

constexpr Rational kRate = {30, 1};
constexpr int64_t kFirstFrame = 150; // five seconds in: particle effects are in steady play
constexpr int kLeastRounds = 5;
constexpr int kMostRounds = 300;
constexpr double kSecondsPerLevel = 2;

// A soft picture with grain: neither flat areas nor pure noise, which some effects take short cuts
// on. Every run makes the same.
Picture Pattern(const Size& size, uint32_t seed) {
    std::mt19937 random(seed);
    Picture picture = {size.width, size.height,
                       std::vector<uint8_t>(size_t{size.width} * size.height * 4)};
    uint8_t* to = picture.pixels.data();
    for (uint32_t y = 0; y < size.height; ++y) {
        for (uint32_t x = 0; x < size.width; ++x, to += 4) {
            const uint32_t grain = random();
            to[0] = static_cast<uint8_t>(x * 200 / size.width + (grain & 31));
            to[1] = static_cast<uint8_t>(y * 200 / size.height + (grain >> 8 & 31));
            to[2] = static_cast<uint8_t>((x ^ y) / 2 % 200 + (grain >> 16 & 31));
            to[3] = 255;
        }
    }
    return picture;
}

double Median(std::vector<double> times) {
    std::nth_element(times.begin(), times.begin() + times.size() / 2, times.end());
    return times[times.size() / 2];
}

double MsOf(const std::function<void()>& work) {
    const Clock::time_point start = Clock::now();
    work();
    return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

// Milliseconds of every round.
struct FrameTimes {
    struct Level {
        int32_t level;
        std::vector<double> ms;
    };
    std::vector<Level> levels;
    std::vector<double> copies;
};

// The levels take turns, so that a busy or throttled machine slows them alike.
class CRace {
public:
    CRace(const EffectDescriptor& effect, const BenchOptions& options)
        : m_shape{options.size.width, options.size.height, false}, m_output(m_shape.Bytes()) {
        for (const int32_t level : options.levels) {
            m_times.levels.push_back({level, {}});
            CClipInstance& instance =
                *m_instances.emplace_back(std::make_unique<CClipInstance>(effect));
            EffectSettings settings = options.settings;
            settings.level = level;
            settings.Apply(instance);
            options.stage.Apply(instance);
            instance.Context().duration = PositionOfFrame(3600 * kRate.num, kRate);
            instance.Begin(m_shape);
        }
        const FrameForm form = {options.settings.ayuv, false};
        for (int i = 0; i < 2; ++i) {
            Picture pattern = Pattern(options.size, i + 1);
            m_inputs[i] = std::move(pattern.pixels);
            form.Apply(m_inputs[i], pattern.width);
        }
    }

    // rounds 0: about two seconds for each level.
    FrameTimes Run(int rounds) {
        double slowest = 0; // a first frame each, which also builds what is built once
        for (const auto& instance : m_instances) {
            RenderFrame(*instance, kFirstFrame);
            slowest = std::max(slowest, MsOf([&] { RenderFrame(*instance, kFirstFrame + 1); }));
        }
        if (rounds == 0) {
            rounds = std::clamp(static_cast<int>(kSecondsPerLevel * 1000 / slowest), kLeastRounds,
                                kMostRounds);
        }
        for (int round = 0; round < rounds; ++round) {
            for (size_t i = 0; i < m_instances.size(); ++i) {
                m_times.copies.push_back(MsOf(
                    [&] { std::memcpy(m_output.data(), m_inputs[0].data(), m_shape.Bytes()); }));
                m_times.levels[i].ms.push_back(
                    MsOf([&] { RenderFrame(*m_instances[i], kFirstFrame + 2 + round); }));
            }
        }
        return std::move(m_times);
    }

private:
    void RenderFrame(CClipInstance& instance, int64_t frame) {
        const uint8_t* const inputs[2] = {m_inputs[0].data(), m_inputs[1].data()};
        instance.Context().position = PositionOfFrame(frame, kRate);
        instance.Render(inputs, m_output.data(), frame);
    }

    FrameShape m_shape;
    std::vector<std::unique_ptr<CClipInstance>> m_instances;
    Frame m_inputs[2], m_output;
    FrameTimes m_times;
};

void PrintJson(const EffectDescriptor& effect, const BenchOptions& options,
               const FrameTimes& times) {
    const double copyMs = Median(times.copies);
    json result = {{"effect", effect.identifier},
                   {"width", options.size.width},
                   {"height", options.size.height},
                   {"format", options.settings.ayuv ? "ayuv" : "argb"},
                   {"threads", options.settings.threads},
                   {"rounds", times.levels.front().ms.size()},
                   {"memcpyMs", copyMs},
                   {"levels", json::array()}};
    for (const FrameTimes::Level& level : times.levels) {
        const double ms = Median(level.ms);
        result["levels"].push_back({{"level", level.level}, {"ms", ms}, {"memcpys", ms / copyMs}});
    }
    std::printf("%s\n", result.dump(2).c_str());
}

void PrintTable(const EffectDescriptor& effect, const BenchOptions& options,
                const FrameTimes& times) {
    const double copyMs = Median(times.copies);
    std::printf("%s, %ux%u %s, %u thread%s, median of %zu\n", ShortName(effect).c_str(),
                options.size.width, options.size.height, options.settings.ayuv ? "AYUV" : "ARGB",
                options.settings.threads, options.settings.threads == 1 ? "" : "s",
                times.levels.front().ms.size());
    std::printf("level   ms/frame   x memcpy   frames/s\n");
    std::printf("memcpy %9.3f %10.2f %10.0f\n", copyMs, 1.0, 1000 / copyMs);
    for (const FrameTimes::Level& level : times.levels) {
        const double ms = Median(level.ms);
        std::printf("%-6d %9.3f %10.2f %10.0f\n", level.level, ms, ms / copyMs, 1000 / ms);
    }
}

} // namespace

void Bench(const ModuleDescriptor& module, const BenchOptions& options) {
    const EffectDescriptor& effect = FindEffect(module, options.stage.effect, kAllEffects);
    const FrameTimes times = CRace(effect, options).Run(options.rounds);
    (options.json ? PrintJson : PrintTable)(effect, options, times);
}

} // namespace kyvhost
