// From files through effects to a file.
#include "host/Render.h"

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

void Render(const ModuleDescriptor& module, const RenderOptions& options) {
    // What the names and options alone tell comes before anything is opened.
    const Container* const container = OutputContainer(options);
    if (container) {
        CheckClip(options);
    } else {
        CheckStill(options);
    }
    if (options.size && !IsPipe(options.input)) {
        throw CUsageError("--size is for raw frames that come over a pipe");
    }
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
