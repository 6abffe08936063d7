// From files through an effect to a file.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "host/Arguments.h"
#include "host/ClipInstance.h"
#include "host/Easing.h"
#include "host/Video.h"

namespace kyvhost {

enum class Stereo {
    Mono,
    SideBySide, // both views are made of the input: the output is twice as wide
    Split,      // the input holds two views already
};

// What an instance is told besides its frames.
struct EffectSettings {
    std::vector<std::string> sets; // "P3=0.8"
    bool ayuv = false;
    int32_t level = CpuLevel_Avx2;
    uint32_t threads = 1;
    uint32_t seed = 0;
    std::optional<Size> aspect; // of the display; the frame's own otherwise
    std::optional<float> preview;
    bool firstField = false, secondField = false;

    // Throws CUsageError.
    void Apply(CClipInstance& instance) const;
};

struct RenderOptions {
    std::string effect;
    EffectSettings settings;
    std::vector<std::string> animations;
    Easing easing = Easing::Linear;
    Stereo stereo = Stereo::Mono;
    std::filesystem::path input, output;
    std::optional<std::filesystem::path> input2;
    std::optional<double> time;     // seconds: of a still output
    std::optional<double> start;    // seconds left out of videos
    std::optional<double> duration; // seconds of the clip
    std::optional<double> overlap;  // seconds in which two whole clips meet; they play side by
                                    // side from start to end otherwise
    std::optional<Rational> rate;
    std::optional<VideoCodec> codec;
    VideoTools tools;
    bool overwrite = false;
    bool quiet = false;
};

void Render(const ModuleDescriptor& module, const RenderOptions& options);

} // namespace kyvhost
