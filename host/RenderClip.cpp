// Many moments as a video.
#include <algorithm>
#include <array>
#include <chrono>
#include <cmath>
#include <functional>
#include <limits>
#include <numeric>
#include <thread>

#include "host/ExitStatus.h"
#include "host/FileNames.h"
#include "host/Player.h"
#include "host/Progress.h"
#include "host/RenderJob.h"
#include "host/RenderPool.h"
#include "hosting/Names.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

// Which frames of the result the effects make; total 0: to the end, wherever that is.
struct Timeline {
    int64_t from = 0, count = 0; // of the effects
    int64_t total = 0;
    bool joined = false; // before from the first input shows, behind the effects the second
};

// When a frame of a video is shown: its place on the grid of the rate, or between two of them.
struct FrameTime {
    double slot = 0;      // whole on the grid
    int64_t position = 0; // 100 ns
    int64_t nanoseconds = 0;
};

FrameTime TimeOfSlot(int64_t slot, const Rational& rate) {
    constexpr int64_t kSecond = 1'000'000'000;
    const int64_t scaled = slot * rate.den; // seconds times rate.num
    return {static_cast<double>(slot), PositionOfFrame(slot, rate),
            scaled / rate.num * kSecond + scaled % rate.num * kSecond / rate.num};
}

// Time stamps are rounded to ticks, of which a file may have few. Where the grid is known and less
// than a tick away it is what was meant.
FrameTime TimeOf(double seconds, const Rational& rate, const Rational& tick, bool onGrid) {
    const double slot = seconds * rate.Value();
    const double nearest = std::round(slot);
    if (onGrid && std::abs(nearest - slot) <= 1.001 * tick.Value() * rate.Value()) {
        return TimeOfSlot(std::llround(nearest), rate);
    }
    return {slot, static_cast<int64_t>(std::floor(seconds * 1e7 + 1e-3)),
            std::llround(seconds * 1e9)};
}

// Fine enough for the grid of the rate and for the stamps of the source.
Rational TickFor(const Rational& rate, const VideoInfo* video) {
    constexpr int64_t kFinest = 10'000'000;
    const bool isWhole = video && video->timeBase.num == 1;
    const int64_t source = isWhole ? video->timeBase.den : 90'000;
    if (!video) {
        return {1, rate.num};
    }
    const int64_t both = std::lcm(rate.num, source);
    return {1, both <= kFinest ? both : source};
}

class CClip {
public:
    explicit CClip(RenderJob& job)
        : m_job(job), m_options(job.options), m_pMaster(job.FirstVideo()), m_rate(Rate()) {}

    void Render(const fs::path& file);
    void Play();
    double MeasuredRate();

private:
    // Takes a finished frame; false when no more are wanted.
    using Take = std::function<bool(FramePtr, int64_t nanoseconds)>;

    class CInputs;

    void SetTimeline();
    Rational Rate() const;
    int64_t Frames();
    Timeline Joined() const;
    SoundJoin JoinedSound() const;
    VideoFormat Format() const;
    FieldOrder Fields() const;
    std::unique_ptr<CFrameSource> Open(const Source& source, bool onGrid) const;
    std::unique_ptr<CRenderPool> Pool() const;
    double Seconds(int64_t slot) const { return static_cast<double>(slot) / m_rate.Value(); }
    double SkippedSeconds() const;

    // All frames go to take, in order. How many.
    int64_t RenderAll(const Take& take);
    int64_t RenderJoined(CRenderPool& pool, const Take& take);
    int64_t RenderTogether(CRenderPool& pool, const Take& take);
    void Write(const VideoFormat& format, const fs::path& file);
    void Add(CRenderPool& pool, std::vector<FramePtr> inputs, const FrameTime& time,
             int64_t number);
    bool Drain(CRenderPool& pool, const Take& take, bool all);

    RenderJob& m_job;
    const RenderOptions& m_options;
    const Source* m_pMaster; // whose times the result has; null when all are pictures
    Rational m_rate;
    Timeline m_timeline;
    int64_t m_nFrom = 0;         // slots that are passed over
    std::deque<int64_t> m_times; // nanoseconds of the frames that are on their way
};

Rational CClip::Rate() const {
    return m_options.rate ? *m_options.rate : m_pMaster ? m_pMaster->video.rate : kStillClipRate;
}

FieldOrder CClip::Fields() const {
    return m_pMaster ? m_pMaster->video.fields : FieldOrder::Progressive;
}

// The length of the result, as far as it is known beforehand; 0 when it is not.
int64_t CClip::Frames() {
    const double longest = 1e15;
    double seconds = longest;
    const Source* shortest = nullptr;
    for (const Source& source : m_job.sources) {
        if (!source.isPicture && source.video.frameCount > 0) {
            const double rest = source.video.seconds - m_options.start.value_or(0);
            shortest = rest < seconds ? &source : shortest;
            seconds = std::min(seconds, rest);
        }
    }
    if (seconds <= 0) {
        throw CUsageError("--start: " + SecondsText(*m_options.start) +
                          " is out of range: the clip lasts " +
                          SecondsText(seconds + *m_options.start));
    }
    if (shortest && m_options.duration && *m_options.duration > seconds + 0.5 / m_rate.Value()) {
        m_job.notes.Say("--duration: " + SecondsText(*m_options.duration) +
                        " is more than there is; " + TextOf(shortest->file) + " ends after " +
                        SecondsText(seconds));
    }
    seconds = std::min(seconds, m_options.duration.value_or(longest));
    if (seconds == longest) {
        seconds = m_pMaster ? 0 : kStillClipSeconds;
    }
    return std::llround(seconds * m_rate.Value());
}

Timeline CClip::Joined() const {
    if (m_options.start || m_options.duration) {
        throw CUsageError("--overlap joins whole clips; it does not go with --start or --duration");
    }
    if (m_job.sources.size() != 2) {
        throw CUsageError("--overlap joins two videos, and " + ShortName(m_job.stack.First()) +
                          " takes one input");
    }
    int64_t frames[2] = {};
    for (size_t i = 0; i < 2; ++i) {
        const Source& source = m_job.sources[i];
        if (source.isPicture || source.video.frameCount == 0) {
            throw CUsageError("--overlap joins two videos, and " + TextOf(source.file) +
                              (source.isPicture ? " is a picture" : " does not tell its length"));
        }
        frames[i] = std::llround(source.video.seconds * m_rate.Value());
    }
    const int64_t overlap = std::llround(*m_options.overlap * m_rate.Value());
    const int64_t most = std::min(frames[0], frames[1]);
    if (overlap < 1 || overlap > most) {
        throw CUsageError("--overlap: " + SecondsText(*m_options.overlap) +
                          " is out of range: one frame to " + SecondsText(Seconds(most)) +
                          ", the shorter video");
    }
    return {frames[0] - overlap, overlap, frames[0] + frames[1] - overlap, true};
}

SoundJoin CClip::JoinedSound() const {
    const auto fileOf = [](const Source& source) {
        return source.video.AudioCodecs().empty() ? fs::path() : source.file;
    };
    return {fileOf(m_job.sources[0]), fileOf(m_job.sources[1]),
            Seconds(m_timeline.from + m_timeline.count),
            Seconds(m_timeline.total - m_timeline.from), Seconds(m_timeline.count)};
}

VideoFormat CClip::Format() const {
    VideoFormat format;
    format.container = OutputContainer(m_options);
    format.width = m_job.shape.frameWidth;
    format.height = m_job.shape.height;
    format.rate = m_rate;
    format.isBt709 = m_job.shape.height >= 720;
    format.options = m_options.encoderOptions;
    for (const Source& source : m_job.sources) {
        format.alpha = format.alpha || (!source.isPicture && source.video.hasAlpha);
    }
    std::string codec = m_options.codec;
    if (codec.empty()) {
        codec = format.alpha && format.container->alphaCodec ? format.container->alphaCodec
                                                             : format.container->codecs.front();
        if (IsDash(m_options.output) && Holds(format.container->codecs, "raw")) {
            codec = "raw"; // somebody else will code it
        }
    }
    format.codec = &FindCodec(codec);
    if (m_options.proxy && (codec == "h264" || codec == "h265")) {
        constexpr std::array kHaste = {"-preset", "ultrafast", "-crf", "28"};
        format.options.insert(format.options.begin(), kHaste.begin(), kHaste.end());
    }
    format.tick = TickFor(m_rate, m_pMaster && !m_options.rate ? &m_pMaster->video : nullptr);
    if (!m_pMaster) {
        return format;
    }
    const VideoInfo& video = m_pMaster->video;
    const double skipped = m_options.start.value_or(0) + Seconds(m_nFrom);
    format.sampleAspect = video.sampleAspect;
    format.isBt709 = video.isBt709;
    format.labels = video.labels;
    format.fields = video.fields;
    if (m_timeline.joined) {
        format.join = JoinedSound();
        return format;
    }
    CarriedSource carried = {m_pMaster->media, video};
    if (skipped > 0) {
        carried.start = video.startSeconds + skipped;
    } else {
        format.startSeconds = video.startSeconds;
    }
    if (skipped > 0 || m_options.duration || m_job.sources.size() > 1) {
        carried.seconds = Seconds(m_timeline.total - m_nFrom);
    }
    format.carried = std::move(carried);
    return format;
}

std::unique_ptr<CFrameSource> CClip::Open(const Source& source, bool onGrid) const {
    const auto [width, height] = m_job.inputSize;
    if (source.isPicture) {
        return StillSource(m_job.PictureAt(source, 0, m_job.inputSize), m_job.Form());
    }
    const double skipped = SkippedSeconds();
    ReaderForm form = {width, height, skipped > 0 ? source.video.startSeconds + skipped : 0, {}};
    if (onGrid) {
        form.rate = m_rate;
    }
    return VideoSource(
        std::make_unique<CVideoReader>(m_options.tools, source.media, source.video, form), width,
        height, m_job.Form());
}

// Of the videos, up to the first frame that is wanted. Stamps are rounded: half a frame less makes
// sure of that frame.
double CClip::SkippedSeconds() const {
    const double passed = m_nFrom > 0 ? (static_cast<double>(m_nFrom) - 0.5) / m_rate.Value() : 0;
    return m_options.start.value_or(0) + passed;
}

std::unique_ptr<CRenderPool> CClip::Pool() const {
    const uint32_t cores = std::max(1U, std::thread::hardware_concurrency());
    const uint32_t jobs = m_options.jobs > 0 ? m_options.jobs : cores;
    const FieldOrder fields =
        m_options.fields == FieldUse::AsVideo ? Fields() : FieldOrder::Progressive;
    const FrameScale scale = {static_cast<double>(std::max<int64_t>(m_timeline.count - 1, 0)),
                              m_rate.Value()};
    std::vector<std::unique_ptr<CStack>> stacks;
    for (uint32_t i = 0; i < jobs; ++i) {
        stacks.push_back(m_job.NewStack());
        stacks.back()->RunTransitions();
        stacks.back()->SetClip(PositionOfFrame(m_timeline.count, m_rate), scale);
        stacks.back()->Begin(m_job.shape, fields);
    }
    return std::make_unique<CRenderPool>(std::move(stacks), m_job.shape.Bytes());
}

void CClip::SetTimeline() {
    m_job.stack.RunTransitions();
    if (m_options.overlap) {
        m_timeline = Joined();
    } else {
        m_timeline.total = m_timeline.count = Frames();
    }
    if (m_timeline.count == 0 && m_job.stack.NeedsLength()) {
        throw CUsageError(TextOf(m_job.sources.front().file) +
                          " does not tell its length; animations need --duration");
    }
    m_nFrom = std::llround(m_options.from * m_rate.Value());
    if (m_timeline.total > 0 && m_nFrom >= m_timeline.total) {
        throw CUsageError("--at: " + SecondsText(m_options.from) +
                          " is out of range: the clip lasts " +
                          SecondsText(Seconds(m_timeline.total)));
    }
}

int64_t CClip::RenderAll(const Take& take) {
    const std::unique_ptr<CRenderPool> pool = Pool();
    return m_timeline.joined ? RenderJoined(*pool, take) : RenderTogether(*pool, take);
}

void CClip::Write(const VideoFormat& format, const fs::path& file) {
    CFrameSink sink(std::make_unique<CVideoWriter>(m_options.tools, file, format),
                    m_job.Form().ayuv);
    CProgress progress(m_timeline.total > 0 ? m_timeline.total - m_nFrom : 0, m_options.quiet);
    int64_t written = 0;
    const int64_t frames = RenderAll([&](FramePtr frame, int64_t nanoseconds) {
        sink.Put(std::move(frame), nanoseconds);
        progress.Update(++written);
        return true;
    });
    if (frames == 0) {
        throw CHostError(ExitStatus::InputUnreadable,
                         TextOf(m_job.sources.front().file) + " holds no frames");
    }
    sink.Finish();
    progress.Finish(frames);
}

void CClip::Render(const fs::path& file) {
    SetTimeline();
    const VideoFormat format = Format();
    for (const std::string& loss : Losses(format)) {
        m_job.notes.Say(loss);
    }
    Write(format, file);
}

void CClip::Play() {
    SetTimeline();
    VideoFormat format = Format();
    format.playerTitle =
        TextOf(m_job.sources.front().file.filename()) + ": " + EffectName(m_job.stack.First());
    try {
        Write(format, "-");
    } catch (const CPlayerClosed&) { // by the user
    }
}

double CClip::MeasuredRate() {
    using Clock = std::chrono::steady_clock;
    constexpr auto kLongest = std::chrono::milliseconds(1500);
    constexpr int64_t kFrames = 24, kWarmUp = 3; // the first ones fill caches and pipes
    SetTimeline();
    const Clock::time_point start = Clock::now();
    Clock::time_point warm = start, last = start;
    int64_t taken = 0;
    RenderAll([&](const FramePtr&, int64_t) {
        last = Clock::now();
        warm = ++taken <= kWarmUp ? last : warm;
        return taken < kFrames && last - start < kLongest;
    });
    const double seconds = std::chrono::duration<double>(last - warm).count();
    return taken > kWarmUp && seconds > 0 ? static_cast<double>(taken - kWarmUp) / seconds
                                          : m_rate.Value();
}

void CClip::Add(CRenderPool& pool, std::vector<FramePtr> inputs, const FrameTime& time,
                int64_t number) {
    Moment moment;
    moment.position = time.position;
    moment.laterField = PositionOfFrame(1, {m_rate.num * 2, m_rate.den});
    moment.frame = time.slot;
    moment.frameNumber = number;
    pool.Add(std::move(inputs), moment);
}

// Hands finished frames on, so that few are on their way. False when no more are wanted.
bool CClip::Drain(CRenderPool& pool, const Take& take, bool all) {
    bool wanted = true;
    while (wanted && (all ? !pool.IsEmpty() : pool.IsFull())) {
        FramePtr frame = pool.Take();
        wanted = take(std::move(frame), m_times.front());
        m_times.pop_front();
    }
    return wanted;
}

int64_t CClip::RenderJoined(CRenderPool& pool, const Take& take) {
    const auto first = Open(m_job.sources[0], true), second = Open(m_job.sources[1], true);
    FramePtr inputs[2];
    int64_t frame = 0;
    for (bool wanted = true; wanted; ++frame) {
        const int64_t step = frame - m_timeline.from; // of the effect
        const bool before = step < 0, behind = step >= m_timeline.count;
        if (!behind) {
            if (std::optional<TimedFrame> next = first->Next()) {
                inputs[0] = std::move(next->pixels); // one that is cut short stands still
            }
        }
        if (!before) {
            std::optional<TimedFrame> next = second->Next();
            inputs[1] = next ? std::move(next->pixels) : nullptr;
        }
        if (!inputs[before ? 0 : 1]) {
            break;
        }
        m_times.push_back(TimeOfSlot(frame, m_rate).nanoseconds);
        if (before || behind) {
            pool.AddCopy(inputs[before ? 0 : 1]);
        } else {
            Add(pool, {inputs[0], inputs[1]}, TimeOfSlot(step, m_rate), frame);
        }
        wanted = Drain(pool, take, false);
    }
    Drain(pool, take, true);
    return frame;
}

// The inputs of a clip that are shown together: the one whose times the result has, and those that
// follow it.
class CClip::CInputs {
public:
    explicit CInputs(const CClip& clip) : m_clip(clip) {
        const bool onGrid = clip.m_options.rate.has_value();
        const Source* const master = clip.m_pMaster;
        for (const Source& source : clip.m_job.sources) {
            std::unique_ptr<CFrameSource> opened = clip.Open(source, onGrid);
            if (&source == master) {
                m_pMaster = std::move(opened);
                m_followers.push_back(nullptr);
                continue;
            }
            const double frameSeconds = source.isPicture ? std::numeric_limits<double>::infinity()
                                                         : 1 / source.video.rate.Value();
            m_followers.push_back(
                std::make_unique<CFollower>(std::move(opened), clip.m_rate, frameSeconds));
        }
        m_bSnaps = onGrid || !master || master->video.isRegular;
        m_tick =
            onGrid || !master ? Rational{clip.m_rate.den, clip.m_rate.num} : master->video.timeBase;
        if (clip.m_nFrom > 0) { // stamps are counted from what has been skipped
            m_start = clip.m_options.start.value_or(0) - clip.SkippedSeconds();
        }
    }

    // A frame of each input; none at the end. number counts them.
    std::vector<FramePtr> Next(int64_t number, FrameTime& time) {
        time = TimeOfSlot(m_clip.m_nFrom + number, m_clip.m_rate);
        std::optional<TimedFrame> next;
        if (m_pMaster) {
            next = m_pMaster->Next();
            if (!next) {
                return {};
            }
            m_start = m_start.value_or(next->seconds);
            time = TimeOf(next->seconds - *m_start, m_clip.m_rate, m_tick, m_bSnaps);
        }
        const double passed = time.slot - static_cast<double>(m_clip.m_nFrom);
        std::vector<FramePtr> frames;
        for (const auto& follower : m_followers) {
            frames.push_back(follower ? follower->At(passed / m_clip.m_rate.Value())
                                      : next->pixels);
            if (!frames.back()) {
                return {};
            }
        }
        return frames;
    }

private:
    const CClip& m_clip;
    std::unique_ptr<CFrameSource> m_pMaster;
    std::vector<std::unique_ptr<CFollower>> m_followers;
    bool m_bSnaps;
    Rational m_tick;
    std::optional<double> m_start; // the stamp of the clip's start
};

int64_t CClip::RenderTogether(CRenderPool& pool, const Take& take) {
    // What a file says about its length may be wrong: only what the user has said is a limit.
    const bool limited = !m_pMaster || m_options.duration;
    CInputs inputs(*this);
    const int64_t passed = TimeOfSlot(m_nFrom, m_rate).nanoseconds;
    int64_t frame = 0;
    for (bool wanted = true; wanted; ++frame) {
        FrameTime time;
        std::vector<FramePtr> frames = inputs.Next(frame, time);
        if (frames.empty() || (limited && std::llround(time.slot) >= m_timeline.total)) {
            break;
        }
        m_times.push_back(std::max<int64_t>(time.nanoseconds - passed, 0));
        Add(pool, std::move(frames), time, frame);
        wanted = Drain(pool, take, false);
    }
    Drain(pool, take, true);
    return frame;
}

} // namespace

void RenderClip(RenderJob& job, const fs::path& file) {
    CClip(job).Render(file);
}

void PlayClip(RenderJob& job) {
    CClip(job).Play();
}

double RenderingRate(RenderJob& job) {
    return CClip(job).MeasuredRate();
}

} // namespace kyvhost
