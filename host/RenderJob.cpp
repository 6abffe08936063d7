// Inputs of a rendering.
#include "host/RenderJob.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "host/ExitStatus.h"
#include "host/FileNames.h"
#include "hosting/Names.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

constexpr uint32_t kProxyRows = 360;

// The mean colour of a disc, as #RRGGBB.
std::string MeanColor(const Picture& picture, const Pick& pick) {
    if (pick.x >= picture.width || pick.y >= picture.height) {
        throw CUsageError("--pick: " + std::to_string(pick.x) + "," + std::to_string(pick.y) +
                          " is out of range: the picture has " + std::to_string(picture.width) +
                          " x " + std::to_string(picture.height) + " pixels");
    }
    const int64_t radius = pick.radius;
    const int64_t left = std::max<int64_t>(0, pick.x - radius);
    const int64_t right = std::min<int64_t>(picture.width - 1, pick.x + radius);
    const int64_t top = std::max<int64_t>(0, pick.y - radius);
    const int64_t bottom = std::min<int64_t>(picture.height - 1, pick.y + radius);
    uint64_t sums[3] = {}, count = 0;
    for (int64_t y = top; y <= bottom; ++y) {
        for (int64_t x = left; x <= right; ++x) {
            const int64_t dx = x - pick.x, dy = y - pick.y;
            if (dx * dx + dy * dy > radius * radius) {
                continue;
            }
            const uint8_t* const pixel =
                &picture
                     .pixels[(static_cast<size_t>(y) * picture.width + static_cast<size_t>(x)) * 4];
            for (int c = 0; c < 3; ++c) {
                sums[c] += pixel[c];
            }
            ++count;
        }
    }
    const auto mean = [&](int c) { return static_cast<unsigned>((sums[c] + count / 2) / count); };
    char text[16];
    std::snprintf(text, sizeof text, "#%02X%02X%02X", mean(2), mean(1), mean(0));
    return text;
}

// The effect's one colour.
const ParamDescriptor& ColorParam(const EffectDescriptor& effect) {
    const ParamDescriptor* found = nullptr;
    for (uint32_t i = 0; i < effect.paramCount; ++i) {
        if (effect.params[i].type == ParamType_Color) {
            if (found) {
                throw CUsageError("--pick: " + ShortName(effect) +
                                  " has several colours; it is for white-balance");
            }
            found = &effect.params[i];
        }
    }
    if (!found) {
        throw CUsageError("--pick: " + ShortName(effect) +
                          " has no colour; it is for white-balance");
    }
    return *found;
}

// A reduced side: a multiple of four, so that two fields of half the rows have chroma of their own.
uint32_t Scaled(uint32_t side, double scale) {
    return scale < 1 ? std::max(1U, static_cast<uint32_t>(side * scale / 4)) * 4 : side;
}

} // namespace

RenderJob::RenderJob(const ModuleDescriptor& descriptor, const RenderOptions& wanted)
    : module(descriptor), options(wanted), notes(wanted.quiet, wanted.strict),
      stack(descriptor, wanted) {
    OutputContainer(options); // a wrong name is told before anything is opened
    OpenSources();
    SetShape();
    SetAspect(stack);
    SayWhatIsCut();
    if (options.pick) {
        const ParamDescriptor& param = ColorParam(stack.First());
        const Source& source = sources.front();
        if (source.media.pipe && !source.isPicture) {
            throw CUsageError("--pick needs an input that can be read twice, not a pipe");
        }
        const double start = options.time.value_or(options.start.value_or(0));
        const Size whole = {source.Width(), source.Height()};
        picked = {param.key, MeanColor(PictureAt(source, start, whole), *options.pick)};
        stack.SetFirst(*picked);
        notes.Tell("picked " + picked->value);
    }
}

bool RenderJob::AllPictures() const {
    return !FirstVideo();
}

const Source* RenderJob::FirstVideo() const {
    const auto video = std::find_if(sources.begin(), sources.end(),
                                    [](const Source& source) { return !source.isPicture; });
    return video == sources.end() ? nullptr : &*video;
}

FrameForm RenderJob::Form() const {
    return {options.settings.ayuv, options.stereo == Stereo::SideBySide};
}

Source RenderJob::Open(const fs::path& file) const {
    Source source;
    source.file = file;
    if (!IsPipe(file) && !IsSequenceName(file) && IsPictureFile(file)) {
        source.isPicture = true;
        source.picture = ReadPicture(file);
        return source;
    }
    source.media = OpenMedia(file, {options.size, options.rate});
    if (source.media.pipe && IsPictureStart(source.media.pipe->Peek(kPictureStartBytes))) {
        source.isPicture = true;
        source.picture = DecodePicture(source.media.pipe->ReadAll(), TextOf(file));
        return source;
    }
    source.video = ProbeVideo(options.tools, source.media);
    if (source.video.isStill) { // a picture in a format that only ffmpeg knows
        Picture picture = {source.video.width, source.video.height, {}};
        picture.pixels.resize(size_t{picture.width} * picture.height * 4);
        CVideoReader reader(options.tools, source.media, source.video,
                            {picture.width, picture.height, 0, {}});
        double seconds = 0;
        if (reader.Read(picture.pixels.data(), seconds)) {
            source.isPicture = true;
            source.picture = std::move(picture);
        }
    }
    return source;
}

void RenderJob::OpenSources() {
    sources.push_back(Open(options.input));
    for (const StageOptions& stage : options.stages) {
        if (stage.input2) {
            if (IsDash(*stage.input2) && IsDash(options.input)) {
                throw CUsageError("standard input is one stream; it cannot be two inputs");
            }
            sources.push_back(Open(*stage.input2));
        }
    }
    if (options.start && AllPictures()) {
        throw CUsageError("--start is for videos, and " + TextOf(options.input) + " is a picture");
    }
    for (const Source& source : sources) {
        for (const std::string& warning : source.media.warnings) {
            notes.Say(warning);
        }
    }
}

void RenderJob::SetShape() {
    const Source& first = sources.front();
    double scale = options.scale.value_or(1);
    if (options.proxy) {
        scale = std::min(scale, double{kProxyRows} / first.Height());
    }
    inputSize = {Scaled(first.Width(), scale), Scaled(first.Height(), scale)};
    shape = {inputSize.width, inputSize.height, options.stereo != Stereo::Mono};
    if (options.stereo == Stereo::SideBySide) {
        shape.frameWidth *= 2;
    } else if (options.stereo == Stereo::Split && shape.frameWidth % 2 != 0) {
        throw CUsageError(TextOf(first.file) + " is " + std::to_string(first.Width()) +
                          " pixels wide; two views side by side need an even width");
    }
}

// The inner picture has the size of the frame, and without the wide map not all of it is reached.
void RenderJob::SayWhatIsCut() {
    constexpr uint32_t kReached = 1024;
    const uint32_t view = shape.ViewWidth();
    if (!options.settings.wideMap && stack.HasInnerPicture() &&
        (view > kReached || shape.height > kReached)) {
        notes.Say("of the inner picture only the first " + std::to_string(kReached) +
                  " columns and rows are reached; without --narrow-map all are");
    }
}

// Pixels that are not square make the display's shape another one than the frame's.
void RenderJob::SetAspect(CStack& to) const {
    const Source& first = sources.front();
    const Rational& pixel = first.video.sampleAspect;
    if (!first.isPicture && pixel.num != pixel.den) {
        const uint32_t view = shape.ViewWidth();
        to.SetDefaultAspect(static_cast<uint32_t>(std::llround(view * pixel.Value())),
                            shape.height);
    }
}

std::unique_ptr<CStack> RenderJob::NewStack() const {
    auto made = std::make_unique<CStack>(module, options);
    SetAspect(*made);
    if (picked) {
        made->SetFirst(*picked);
    }
    return made;
}

std::vector<StageOptions> RenderJob::Stages() const {
    std::vector<StageOptions> stages = options.stages;
    if (picked) {
        stages.front().values.push_back(*picked);
    }
    return stages;
}

Picture RenderJob::PictureAt(const Source& source, double seconds, const Size& size) const {
    const auto [width, height] = size;
    if (source.isPicture) {
        const Picture& picture = source.picture;
        return picture.width == width && picture.height == height ? picture
                                                                  : Resized(picture, width, height);
    }
    const VideoInfo& video = source.video;
    if (video.frameCount > 0) {
        // The last frame stays on the screen until the end.
        const double last = video.seconds - 1 / video.rate.Value();
        seconds = std::min(seconds, std::max(last, 0.0));
    }
    Picture picture = {width, height, std::vector<uint8_t>(size_t{width} * height * 4)};
    const double start = seconds > 0 ? video.startSeconds + seconds : 0;
    CVideoReader reader(options.tools, source.media, video,
                        {width, height, start, options.rate.value_or(video.rate)});
    double shown = 0;
    if (!reader.Read(picture.pixels.data(), shown)) {
        throw CHostError(ExitStatus::InputUnreadable,
                         TextOf(source.file) + " has no frame at " + SecondsText(seconds));
    }
    return picture;
}

std::string SecondsText(double seconds) {
    char text[32];
    std::snprintf(text, sizeof text, "%.6g s", seconds);
    return text;
}

} // namespace kyvhost
