// From files through effects to a file.
#include "host/Render.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <fstream>

#include "host/EffectFile.h"
#include "host/ExitStatus.h"
#include "host/FileNames.h"
#include "host/OutputFile.h"
#include "host/RenderJob.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

// One picture, not a clip: by the name and, where a format is both, by what has been asked for.
bool IsStill(const RenderJob& job) {
    const RenderOptions& options = job.options;
    if (!options.outputFormat.empty() || IsSequenceName(options.output)) {
        return false;
    }
    if (IsPictureName(options.output)) {
        return true;
    }
    const std::string muxer = OutputContainer(options)->muxer;
    return (muxer == "webp" || muxer == "gif" || muxer == "apng") && job.AllPictures() &&
           !options.duration && !options.rate;
}

void CheckStill(const RenderOptions& options) {
    const char* const option = !options.codec.empty() ? "--codec"
                               : options.start        ? "--start"
                               : options.rate         ? "--rate"
                               : options.overlap      ? "--overlap"
                                                      : nullptr;
    if (option) {
        throw CUsageError(std::string(option) + " is for videos, and " + TextOf(options.output) +
                          " is a picture");
    }
}

void CheckClip(const RenderOptions& options) {
    const std::string muxer = OutputContainer(options)->muxer;
    if (options.time && muxer != "webp" && muxer != "gif" && muxer != "apng") {
        throw CUsageError("--time is for pictures; a video takes --start and --duration");
    }
    const Container& container = *OutputContainer(options);
    if (!options.codec.empty()) {
        const Codec& codec = FindCodec(options.codec);
        if (!Holds(container.codecs, codec.name)) {
            throw CUsageError(TextOf(options.output) + ": " + codec.title + " does not go into ." +
                              container.endings.front() + "; it takes " +
                              Join({container.codecs.begin(), container.codecs.end()}, ", "));
        }
    }
}

// The part of its size at which the clip keeps pace here.
double PlayableScale(RenderJob& job) {
    constexpr double kSpare = 0.75; // the rest is for showing the frames
    constexpr std::array kScales = {1.0, 0.75, 0.5, 0.375, 0.25, 0.1875};
    const Source* const video = job.FirstVideo();
    const Rational wanted = job.options.rate.value_or(video ? video->video.rate : kStillClipRate);
    // Frames of a quarter of the pixels take a quarter of the time.
    const double side = std::sqrt(RenderingRate(job) * kSpare / wanted.Value());
    const auto fits = std::find_if(kScales.begin(), kScales.end(),
                                   [side](double scale) { return scale <= side; });
    return fits == kScales.end() ? kScales.back() : *fits;
}

void CheckRawSize(const RenderOptions& options) {
    if (options.size && !IsPipe(options.input)) {
        throw CUsageError("--size is for raw frames that come over a pipe");
    }
}

void WriteText(const fs::path& file, const std::string& text) {
    std::ofstream stream(file, std::ios::binary);
    stream << text;
    if (!stream.flush()) {
        throw CHostError(ExitStatus::RenderingFailed, TextOf(file) + " cannot be written");
    }
}

} // namespace

const Container* OutputContainer(const RenderOptions& options) {
    if (!options.outputFormat.empty()) {
        const Container* const container = FindContainerByName(options.outputFormat);
        if (!container || std::string_view(container->muxer) == "image2") {
            throw CUsageError("--output-format: " + Quoted(options.outputFormat) +
                              " is not one of " + VideoEndings());
        }
        return container;
    }
    if (IsDash(options.output)) {
        return FindContainerByName("nut");
    }
    const Container* const container = FindContainer(options.output);
    const bool isPicture = IsPictureName(options.output);
    if (!container && !isPicture) {
        throw CUsageError(TextOf(options.output) +
                          ": name a .png, .jpg, .tif or .bmp picture or a video, one of " +
                          VideoEndings());
    }
    return isPicture && !IsSequenceName(options.output) ? nullptr : container;
}

void EffectSettings::Apply(CClipInstance& instance) const {
    EffectContext& context = instance.Context();
    context.pixelFormat = ayuv ? PixelFormat_Ayuv : PixelFormat_Argb;
    context.cpuLevel = level | (wideMap ? int32_t{CpuLevelOption_WideMap} : 0);
    context.threadCount = threads;
    if (aspect) {
        context.displayAspectX = aspect->width;
        context.displayAspectY = aspect->height;
    }
    if (preview) {
        context.preview = 1;
        context.previewFraction = *preview;
    }
    instance.SetFields(firstField, secondField);
}

void Play(const ModuleDescriptor& module, const RenderOptions& options) {
    CheckRawSize(options);
    RenderJob job(module, options);
    const bool pipe = std::any_of(job.sources.begin(), job.sources.end(),
                                  [](const Source& source) { return source.media.pipe; });
    // A pipe is read but once.
    const double scale = pipe || options.scale ? 1 : PlayableScale(job);
    if (scale == 1) {
        PlayClip(job);
        return;
    }
    RenderOptions reduced = options;
    reduced.scale = scale;
    RenderJob small(module, reduced);
    const auto text = [](const Size& size) {
        return std::to_string(size.width) + " x " + std::to_string(size.height);
    };
    small.notes.Tell("shown at " + text(small.inputSize) + ": the machine is too slow for " +
                     text(job.inputSize));
    PlayClip(small);
}

void Render(const ModuleDescriptor& module, const RenderOptions& options) {
    // What the names and options alone tell comes before anything is opened.
    const Container* const container = OutputContainer(options);
    if (container) {
        CheckClip(options);
    } else {
        CheckStill(options);
    }
    CheckRawSize(options);
    RenderJob job(module, options);
    std::vector<fs::path> inputs;
    for (const Source& source : job.sources) {
        inputs.push_back(source.file);
    }
    COutput output(options.output, options.overwrite, inputs);
    std::unique_ptr<COutputFile> saved;
    if (!options.save.empty()) {
        saved = std::make_unique<COutputFile>(options.save, options.overwrite, inputs);
        WriteText(saved->Temporary(), EffectFileText(module, job.Stages(), options.save));
    }
    if (IsStill(job)) {
        RenderStill(job, output.Temporary());
    } else {
        RenderClip(job, output.Temporary());
    }
    output.Commit();
    if (saved) {
        saved->Commit();
    }
}

} // namespace kyvhost
