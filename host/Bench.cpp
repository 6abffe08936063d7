// Timing of effects.
#include "host/Bench.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <functional>
#include <memory>
#include <random>

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

struct Contestant {
    int32_t level;
    std::unique_ptr<CClipInstance> instance;
    std::vector<double> ms;

    double Median() {
        std::nth_element(ms.begin(), ms.begin() + ms.size() / 2, ms.end());
        return ms[ms.size() / 2];
    }
};

double MsOf(const std::function<void()>& work) {
    const Clock::time_point start = Clock::now();
    work();
    return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

} // namespace

void Bench(const ModuleDescriptor& module, const BenchOptions& options) {
    const EffectDescriptor& effect = FindEffect(module, options.stage.effect, kAllEffects);
    const FrameShape shape = {options.size.width, options.size.height, false};
    std::vector<Contestant> contestants;
    for (const int32_t level : options.levels) {
        contestants.push_back({level, std::make_unique<CClipInstance>(effect), {}});
        EffectSettings settings = options.settings;
        settings.level = level;
        CClipInstance& instance = *contestants.back().instance;
        settings.Apply(instance);
        options.stage.Apply(instance);
        instance.Context().duration = PositionOfFrame(3600 * kRate.num, kRate);
        instance.Begin(shape);
    }
    const FrameForm form = {options.settings.ayuv, false};
    const auto first = StillSource(Pattern(options.size, 1), form);
    const auto second = StillSource(Pattern(options.size, 2), form);
    const std::optional<TimedFrame> firstFrame = first->Next(), secondFrame = second->Next();
    const uint8_t* const inputs[2] = {firstFrame->pixels->data(), secondFrame->pixels->data()};
    std::vector<uint8_t> output(shape.Bytes());
    std::vector<double> copies;

    const auto renderFrame = [&](CClipInstance& instance, int64_t frame) {
        instance.Context().position = PositionOfFrame(frame, kRate);
        instance.Render(inputs, output.data(), frame);
    };
    double slowest = 0; // a first frame each, which also builds what is built once
    for (const Contestant& contestant : contestants) {
        renderFrame(*contestant.instance, kFirstFrame);
        slowest =
            std::max(slowest, MsOf([&] { renderFrame(*contestant.instance, kFirstFrame + 1); }));
    }
    const int rounds = options.rounds > 0
                           ? options.rounds
                           : std::clamp(static_cast<int>(kSecondsPerLevel * 1000 / slowest),
                                        kLeastRounds, kMostRounds);
    for (int round = 0; round < rounds; ++round) {
        for (Contestant& contestant : contestants) {
            copies.push_back(MsOf([&] { std::memcpy(output.data(), inputs[0], shape.Bytes()); }));
            contestant.ms.push_back(
                MsOf([&] { renderFrame(*contestant.instance, kFirstFrame + 2 + round); }));
        }
    }
    std::nth_element(copies.begin(), copies.begin() + copies.size() / 2, copies.end());
    const double copyMs = copies[copies.size() / 2];

    if (options.json) {
        json result = {{"effect", effect.identifier},
                       {"width", options.size.width},
                       {"height", options.size.height},
                       {"format", options.settings.ayuv ? "ayuv" : "argb"},
                       {"threads", options.settings.threads},
                       {"rounds", rounds},
                       {"memcpyMs", copyMs},
                       {"levels", json::array()}};
        for (Contestant& contestant : contestants) {
            const double ms = contestant.Median();
            result["levels"].push_back(
                {{"level", contestant.level}, {"ms", ms}, {"memcpys", ms / copyMs}});
        }
        std::printf("%s\n", result.dump(2).c_str());
        return;
    }
    std::printf("%s, %ux%u %s, %u thread%s, median of %d\n", ShortName(effect).c_str(),
                options.size.width, options.size.height, options.settings.ayuv ? "AYUV" : "ARGB",
                options.settings.threads, options.settings.threads == 1 ? "" : "s", rounds);
    std::printf("level   ms/frame   x memcpy   frames/s\n");
    std::printf("memcpy %9.3f %10.2f %10.0f\n", copyMs, 1.0, 1000 / copyMs);
    for (Contestant& contestant : contestants) {
        const double ms = contestant.Median();
        std::printf("%-6d %9.3f %10.2f %10.0f\n", contestant.level, ms, ms / copyMs, 1000 / ms);
    }
}

} // namespace kyvhost
