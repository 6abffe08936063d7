// Rendering of stills and clips.
#include "host/Render.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>

#include "host/AyuvFrame.h"
#include "host/Clip.h"
#include "host/ExitStatus.h"
#include "host/OutputFile.h"
#include "host/Picture.h"
#include "host/Progress.h"
#include "hosting/Names.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

constexpr double kStillClipSeconds = 10; // of a clip of pictures, when nothing says more
constexpr Rational kStillClipRate = {30, 1};

// An input file, opened as far as to know what it is.
struct Source {
    fs::path file;
    bool isPicture = false;
    Picture picture;
    VideoInfo video;

    uint32_t Width() const { return isPicture ? picture.width : video.width; }
    uint32_t Height() const { return isPicture ? picture.height : video.height; }
};

Source OpenSource(const VideoTools& tools, const fs::path& file) {
    Source source;
    source.file = file;
    source.isPicture = IsPictureFile(file);
    if (source.isPicture) {
        source.picture = ReadPicture(file);
    } else {
        source.video = ProbeVideo(tools, file);
    }
    return source;
}

// Seconds with what a person would write.
std::string SecondsText(double seconds) {
    char text[32];
    std::snprintf(text, sizeof text, "%.6g s", seconds);
    return text;
}

double SecondsOf(const VideoInfo& video) {
    return static_cast<double>(video.frameCount) / video.rate.Value();
}

int64_t UnitsOf(double seconds) {
    return std::llround(seconds * 1e7);
}

// The kinds of output by the name.
bool IsStillName(const fs::path& file) {
    return IsPictureName(file);
}

VideoCodec CodecFor(const RenderOptions& options) {
    const VideoCodec codec = options.codec.value_or(VideoCodec::H264);
    CheckContainer(options.output, codec);
    return codec;
}

// Which frames of the result the effect makes; total 0: to the end, wherever that is.
struct Timeline {
    int64_t from = 0, count = 0; // of the effect
    int64_t total = 0;
    bool joined = false; // before from the first input shows, behind the effect the second
};

class CRendering {
public:
    CRendering(const ModuleDescriptor& module, const RenderOptions& options)
        : m_options(options), m_effect(FindEffect(module, options.effect, kAllEffects)),
          m_instance(m_effect) {
        options.settings.Apply(m_instance);
        for (const std::string& animation : options.animations) {
            m_instance.Animate(animation, options.easing);
        }
        CheckOutput();
        OpenSources();
        SetShape();
    }

    void Run() {
        std::vector<fs::path> inputs;
        for (const Source& source : m_sources) {
            inputs.push_back(source.file);
        }
        COutputFile output(m_options.output, m_options.overwrite, inputs);
        if (IsStillName(m_options.output)) {
            RenderStill(output.Temporary());
        } else {
            RenderClip(output.Temporary());
        }
        output.Commit();
    }

private:
    void CheckOutput() const;
    void OpenSources();
    void SetShape();

    void RenderStill(const fs::path& file);
    Picture PictureAt(const Source& source, double seconds) const;

    void RenderClip(const fs::path& file);
    void RunTransition();
    Rational ClipRate() const;
    int64_t ClipFrames(const Rational& rate) const;
    Timeline JoinedTimeline(const Rational& rate) const;
    int64_t RenderFrames(const Timeline& timeline, const Rational& rate, CFrameSink& sink,
                         CProgress& progress);
    std::unique_ptr<CFrameSource> Frames(const Source& source, const Rational& rate) const;
    VideoFormat Format(const Rational& rate, int64_t frames) const;
    SoundJoin JoinedSound(const Timeline& timeline, const Rational& rate) const;

    bool AllPictures() const {
        return std::all_of(m_sources.begin(), m_sources.end(),
                           [](const Source& source) { return source.isPicture; });
    }

    FrameForm Form() const {
        return {m_options.settings.ayuv, m_options.stereo == Stereo::SideBySide};
    }

    const RenderOptions& m_options;
    const EffectDescriptor& m_effect;
    CClipInstance m_instance;
    std::vector<Source> m_sources;
    FrameShape m_shape;
};

void CRendering::CheckOutput() const {
    if (IsStillName(m_options.output)) {
        if (m_options.codec || m_options.start || m_options.rate || m_options.overlap) {
            throw CUsageError(std::string(m_options.codec   ? "--codec"
                                          : m_options.start ? "--start"
                                          : m_options.rate  ? "--rate"
                                                            : "--overlap") +
                              " is for videos, and " + TextOf(m_options.output) + " is a picture");
        }
    } else if (IsVideoName(m_options.output)) {
        CodecFor(m_options);
        if (m_options.time) {
            throw CUsageError("--time is for pictures; a video takes --start and --duration");
        }
    } else {
        throw CUsageError(
            TextOf(m_options.output) +
            ": name a .png, .jpg, .tif or .bmp picture or a .mp4, .m4v, .mov or .mkv video");
    }
}

void CRendering::OpenSources() {
    const uint32_t inputs = m_effect.properties.inputCount;
    if (inputs == 2 && !m_options.input2) {
        throw CUsageError(ShortName(m_effect) + " takes two inputs: name the second with --input2");
    }
    if (inputs != 2 && m_options.input2) {
        throw CUsageError(ShortName(m_effect) + " takes one input; --input2 is not for it");
    }
    m_sources.push_back(OpenSource(m_options.tools, m_options.input));
    if (m_options.input2) {
        m_sources.push_back(OpenSource(m_options.tools, *m_options.input2));
    }
    if (m_options.start && AllPictures()) {
        throw CUsageError("--start is for videos, and " + TextOf(m_options.input) +
                          " is a picture");
    }
}

void CRendering::SetShape() {
    const Source& first = m_sources.front();
    m_shape = {first.Width(), first.Height(), m_options.stereo != Stereo::Mono};
    if (m_options.stereo == Stereo::SideBySide) {
        m_shape.frameWidth *= 2;
    } else if (m_options.stereo == Stereo::Split && m_shape.frameWidth % 2 != 0) {
        throw CUsageError(TextOf(first.file) + " is " + std::to_string(first.Width()) +
                          " pixels wide; two views side by side need an even width");
    }
    // Pixels that are not square make the display's shape another one than the frame's.
    const Rational& pixel = first.video.sampleAspect;
    if (!m_options.settings.aspect && !first.isPicture && pixel.num != pixel.den) {
        const uint32_t view = m_shape.sideBySide ? m_shape.frameWidth / 2 : m_shape.frameWidth;
        m_instance.Context().displayAspectX =
            static_cast<uint32_t>(std::llround(view * pixel.Value()));
        m_instance.Context().displayAspectY = m_shape.height;
    }
}

Picture CRendering::PictureAt(const Source& source, double seconds) const {
    const uint32_t width = m_sources.front().Width(), height = m_shape.height;
    if (source.isPicture) {
        const Picture& picture = source.picture;
        return picture.width == width && picture.height == height ? picture
                                                                  : Resized(picture, width, height);
    }
    const VideoInfo& video = source.video;
    if (video.frameCount > 0) {
        // The last frame stays on the screen until the end.
        const auto last = static_cast<double>(video.frameCount - 1) / video.rate.Value();
        seconds = std::min(seconds, last);
    }
    Picture picture = {width, height, std::vector<uint8_t>(size_t{width} * height * 4)};
    const double start = seconds > 0 ? video.startSeconds + seconds : 0;
    CVideoReader reader(m_options.tools, source.file, video, width, height, video.rate, start);
    if (!reader.Read(picture.pixels.data())) {
        throw CHostError(ExitStatus::InputUnreadable,
                         TextOf(source.file) + " has no frame at " + SecondsText(seconds));
    }
    return picture;
}

void CRendering::RenderStill(const fs::path& file) {
    const Source& first = m_sources.front();
    double duration = m_options.duration.value_or(0);
    if (!m_options.duration) {
        duration = !first.isPicture && first.video.frameCount > 0 ? SecondsOf(first.video)
                                                                  : kStillClipSeconds;
    }
    const double time = m_options.time.value_or(duration / 2);
    if (time > duration) {
        throw CUsageError("--time: " + SecondsText(time) + " is out of range: the clip lasts " +
                          SecondsText(duration) +
                          (m_options.duration ? "" : "; --duration sets another length"));
    }
    std::vector<Frame> frames;
    for (const Source& source : m_sources) {
        Picture picture = PictureAt(source, time);
        frames.push_back(std::move(picture.pixels));
        Form().Apply(frames.back(), picture.width);
    }
    m_instance.Context().position = UnitsOf(time);
    m_instance.Context().duration = UnitsOf(duration);
    m_instance.ApplyAnimations(duration > 0 ? time / duration : 0);
    m_instance.Begin(m_shape);
    Picture result = {m_shape.frameWidth, m_shape.height, std::vector<uint8_t>(m_shape.Bytes())};
    const uint8_t* const inputs[2] = {frames.front().data(), frames.back().data()};
    m_instance.Render(inputs, result.pixels.data(), 0);
    if (m_options.settings.ayuv) {
        AyuvToBgra(result.pixels.data(), m_shape.Pixels());
    }
    WritePicture(result, file, m_options.output);
}

Rational CRendering::ClipRate() const {
    if (m_options.rate) {
        return *m_options.rate;
    }
    for (const Source& source : m_sources) {
        if (!source.isPicture) {
            return source.video.rate;
        }
    }
    return kStillClipRate;
}

// The length of the result, as far as it is known beforehand; 0 when it is not.
int64_t CRendering::ClipFrames(const Rational& rate) const {
    const double longest = 1e15;
    double seconds = longest;
    for (const Source& source : m_sources) {
        if (!source.isPicture && source.video.frameCount > 0) {
            seconds = std::min(seconds, SecondsOf(source.video) - m_options.start.value_or(0));
        }
    }
    if (seconds <= 0) {
        throw CUsageError("--start: " + SecondsText(*m_options.start) +
                          " is out of range: the clip lasts " +
                          SecondsText(seconds + *m_options.start));
    }
    seconds = std::min(seconds, m_options.duration.value_or(longest));
    if (seconds == longest) {
        seconds = AllPictures() ? kStillClipSeconds : 0;
    }
    return std::llround(seconds * rate.Value());
}

std::unique_ptr<CFrameSource> CRendering::Frames(const Source& source, const Rational& rate) const {
    const uint32_t width = m_sources.front().Width(), height = m_shape.height;
    if (source.isPicture) {
        return StillSource(PictureAt(source, 0), Form());
    }
    const double skipped = m_options.start.value_or(0);
    const double start = skipped > 0 ? source.video.startSeconds + skipped : 0;
    return VideoSource(std::make_unique<CVideoReader>(m_options.tools, source.file, source.video,
                                                      width, height, rate, start),
                       width, height, Form());
}

VideoFormat CRendering::Format(const Rational& rate, int64_t frames) const {
    VideoFormat format;
    format.codec = CodecFor(m_options);
    format.width = m_shape.frameWidth;
    format.height = m_shape.height;
    format.rate = rate;
    format.isBt709 = m_shape.height >= 720;
    for (const Source& source : m_sources) {
        if (source.isPicture) {
            continue;
        }
        const VideoInfo& video = source.video;
        const double skipped = m_options.start.value_or(0);
        format.sampleAspect = video.sampleAspect;
        format.isBt709 = video.isBt709;
        if (!video.audioCodecs.empty()) {
            format.soundFile = source.file;
            format.audioCodecs = video.audioCodecs;
        }
        if (skipped > 0) {
            format.soundStart = video.startSeconds + skipped;
        } else {
            format.startSeconds = video.startSeconds;
        }
        if (skipped > 0 || m_options.duration || m_sources.size() > 1) {
            format.soundSeconds = static_cast<double>(frames) / rate.Value();
        }
        break;
    }
    return format;
}

// A transition over a clip goes from one input to the other unless told otherwise.
void CRendering::RunTransition() {
    for (uint32_t i = 0; i < m_effect.paramCount && m_effect.properties.isTransition; ++i) {
        const ParamDescriptor& param = m_effect.params[i];
        if (WordsOfKey(param.nameKey) == "Percentage" && !m_instance.IsGiven(i)) {
            m_instance.Animate(std::string(param.key) + "=0:1", m_options.easing);
        }
    }
}

void CRendering::RenderClip(const fs::path& file) {
    RunTransition();
    const Rational rate = ClipRate();
    Timeline timeline;
    if (m_options.overlap) {
        timeline = JoinedTimeline(rate);
    } else {
        timeline.total = timeline.count = ClipFrames(rate);
    }
    if (timeline.count == 0 && m_instance.IsAnimated()) {
        throw CUsageError(TextOf(m_sources.front().file) +
                          " does not tell its length; animations need --duration");
    }
    VideoFormat format = Format(rate, timeline.total);
    if (timeline.joined) {
        format.join = JoinedSound(timeline, rate);
        format.audioCodecs.clear();
    }
    const std::vector<std::string> recoded = RecodedAudio(m_options.output, format.audioCodecs);
    if (!recoded.empty() && !m_options.quiet) {
        std::fprintf(stderr, "kyvhost: note: the sound becomes AAC; %s cannot hold %s\n",
                     TextOf(m_options.output.extension()).c_str(), Join(recoded, ", ").c_str());
    }
    CFrameSink sink(std::make_unique<CVideoWriter>(m_options.tools, file, format), m_shape.Bytes(),
                    m_options.settings.ayuv);
    m_instance.Context().duration = PositionOfFrame(timeline.count, rate);
    m_instance.Begin(m_shape);
    CProgress progress(timeline.total, m_options.quiet);
    const int64_t frames = RenderFrames(timeline, rate, sink, progress);
    sink.Finish();
    progress.Finish(frames);
}

// The number of frames rendered.
int64_t CRendering::RenderFrames(const Timeline& timeline, const Rational& rate, CFrameSink& sink,
                                 CProgress& progress) {
    std::vector<std::unique_ptr<CFrameSource>> sources;
    for (const Source& source : m_sources) {
        sources.push_back(Frames(source, rate));
    }
    // What a file says about its length may be wrong: only what the user has said is a limit.
    const bool limited = AllPictures() || m_options.duration;
    const uint8_t* inputs[2] = {};
    int64_t frame = 0;
    for (; !limited || frame < timeline.total; ++frame) {
        const int64_t step = frame - timeline.from; // of the effect
        const bool before = timeline.joined && step < 0;
        const bool behind = timeline.joined && step >= timeline.count;
        if (!behind) {
            const uint8_t* const next = sources[0]->Next();
            if (!next && !timeline.joined) {
                break;
            }
            inputs[0] = next ? next : inputs[0]; // a first clip that is cut short stands still
        }
        if (!before) {
            inputs[1] = sources.size() == 1 ? inputs[0] : sources[1]->Next();
        }
        if (!inputs[before ? 0 : 1]) {
            break;
        }
        Frame output = sink.Take();
        if (before || behind) {
            std::memcpy(output.data(), inputs[before ? 0 : 1], m_shape.Bytes());
        } else {
            m_instance.Context().position = PositionOfFrame(step, rate);
            m_instance.ApplyAnimations(
                timeline.count > 1 ? static_cast<double>(step) / double(timeline.count - 1) : 1);
            m_instance.Render(inputs, output.data(), frame);
        }
        sink.Put(std::move(output));
        progress.Update(frame + 1);
    }
    if (frame == 0) {
        throw CHostError(ExitStatus::InputUnreadable,
                         TextOf(m_sources.front().file) + " holds no frames");
    }
    return frame;
}

Timeline CRendering::JoinedTimeline(const Rational& rate) const {
    if (m_options.start || m_options.duration) {
        throw CUsageError("--overlap joins whole clips; it does not go with --start or --duration");
    }
    if (m_sources.size() != 2) {
        throw CUsageError("--overlap joins two videos, and " + ShortName(m_effect) +
                          " takes one input");
    }
    int64_t frames[2] = {};
    for (size_t i = 0; i < 2; ++i) {
        if (m_sources[i].isPicture || m_sources[i].video.frameCount == 0) {
            throw CUsageError(
                "--overlap joins two videos, and " + TextOf(m_sources[i].file) +
                (m_sources[i].isPicture ? " is a picture" : " does not tell its length"));
        }
        frames[i] = std::llround(SecondsOf(m_sources[i].video) * rate.Value());
    }
    const int64_t overlap = std::llround(*m_options.overlap * rate.Value());
    const int64_t most = std::min(frames[0], frames[1]);
    if (overlap < 1 || overlap > most) {
        throw CUsageError(
            "--overlap: " + SecondsText(*m_options.overlap) + " is out of range: one frame to " +
            SecondsText(static_cast<double>(most) / rate.Value()) + ", the shorter video");
    }
    return {frames[0] - overlap, overlap, frames[0] + frames[1] - overlap, true};
}

SoundJoin CRendering::JoinedSound(const Timeline& timeline, const Rational& rate) const {
    const auto fileOf = [](const Source& source) {
        return source.video.audioCodecs.empty() ? fs::path() : source.file;
    };
    const auto seconds = [&rate](int64_t frames) {
        return static_cast<double>(frames) / rate.Value();
    };
    return {fileOf(m_sources[0]), fileOf(m_sources[1]), seconds(timeline.from + timeline.count),
            seconds(timeline.total - timeline.from), seconds(timeline.count)};
}

} // namespace

void EffectSettings::Apply(CClipInstance& instance) const {
    EffectContext& context = instance.Context();
    for (const std::string& assignment : sets) {
        instance.Set(assignment);
    }
    context.pixelFormat = ayuv ? PixelFormat_Ayuv : PixelFormat_Argb;
    context.cpuLevel = level;
    context.threadCount = threads;
    context.randomSeed = seed;
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
    CRendering(module, options).Run();
}

} // namespace kyvhost
