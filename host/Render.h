// From files through an effect to a file.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "host/Arguments.h"
#include "host/Stage.h"
#include "host/VideoProbe.h"

namespace kyvhost {

enum class Stereo {
    Mono,
    SideBySide, // both views are made of the input: the output is twice as wide
    Split,      // the input holds two views already
};

// What every instance of a rendering is told besides its frames.
struct EffectSettings {
    bool ayuv = false;
    int32_t level = CpuLevel_Avx2;
    bool wideMap = true; // the inner picture may have more than 1024 columns or rows
    uint32_t threads = 1;
    std::optional<Size> aspect; // of the display; the frame's own otherwise
    std::optional<float> preview;
    bool firstField = false, secondField = false;

    void Apply(CClipInstance& instance) const;
};

enum class FieldUse {
    AsVideo, // frames of two fields are rendered field by field
    Frames,  // every frame as one picture
};

// A spot of the input whose colour white is to be.
struct Pick {
    uint32_t x = 0, y = 0, radius = 8; // pixels
};

struct RenderOptions {
    std::vector<StageOptions> stages; // one at least
    EffectSettings settings;
    Stereo stereo = Stereo::Mono;
    FieldUse fields = FieldUse::AsVideo;
    std::filesystem::path input, output;
    std::optional<double> time;     // seconds: of a still output
    std::optional<double> start;    // seconds left out of videos
    std::optional<double> duration; // seconds of the clip
    double from = 0;                // seconds of the clip that are passed over: it goes on then
                                    // as if they had been rendered
    std::optional<double> scale;    // of the inputs' width and height, at most 1; for playing
                                    // what keeps pace, else 1
    std::optional<double> overlap;  // seconds in which two whole clips meet; they play side by
                                    // side from start to end otherwise
    std::optional<Rational> rate;
    std::optional<Size> size; // of raw frames that come over a pipe
    std::optional<Pick> pick;
    std::string codec;                       // empty: the container's usual one
    std::string outputFormat;                // an ending; empty: that of the name
    std::vector<std::string> encoderOptions; // for ffmpeg, the last before the output
    uint32_t jobs = 0;                       // frames at a time; 0: the processor's cores
    VideoTools tools;
    std::filesystem::path save; // where the effects go, as a file; empty: nowhere
    bool proxy = false;         // small and quick
    bool overwrite = false;
    bool strict = false;
    bool quiet = false;
};

void Render(const ModuleDescriptor& module, const RenderOptions& options);

// Shows the clip in a window, with sound, as fast as it is meant to go: at a reduced size when the
// machine cannot keep pace with the whole one.
void Play(const ModuleDescriptor& module, const RenderOptions& options);

} // namespace kyvhost
