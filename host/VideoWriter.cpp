// Videos out through ffmpeg.
#include "host/VideoWriter.h"

#include <algorithm>
#include <cstdio>

#include "host/ExitStatus.h"
#include "host/Ffmpeg.h"
#include "host/FileNames.h"
#include "host/FrameStream.h"
#include "host/Player.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;
using kyv::ChildStream;
using Arguments = std::vector<std::string>;

void Add(Arguments& to, const Arguments& more) {
    to.insert(to.end(), more.begin(), more.end());
}

std::string Decimal(double number) {
    char text[64];
    std::snprintf(text, sizeof text, "%.6f", number);
    return text;
}

std::string OutputArgument(const fs::path& file) {
    return IsDash(file) ? "pipe:1" : "file:" + TextOf(file);
}

std::string Ending(const VideoFormat& format) {
    return "." + std::string(format.container->endings.front());
}

// What goes along with the pictures, and what does not.
struct Plan {
    Arguments maps;
    std::vector<std::string> losses;
};

bool IsTextSubtitle(const std::string& codec) {
    return Holds({"subrip", "ass", "ssa", "webvtt", "mov_text", "text"}, codec);
}

class CPlanner {
public:
    explicit CPlanner(const VideoFormat& format)
        : m_format(format), m_container(*format.container), m_info(format.carried->info) {}

    Plan Make() {
        if (m_info.hasTitle && (!m_container.titles || m_format.carried->input.pipe)) {
            m_plan.losses.push_back("the title is left out: " +
                                    (m_container.titles ? "it does not go through a pipe"
                                                        : Ending(m_format) + " has none"));
        }
        if (m_format.carried->input.pipe) { // nobody can read it a second time
            for (const StreamInfo& stream : m_info.others) {
                Lose(stream, "does not go through a pipe");
            }
            return std::move(m_plan);
        }
        for (const StreamInfo& stream : m_info.others) {
            Carry(stream);
        }
        if (m_info.chapters > 0 && !m_container.chapters) {
            m_plan.losses.push_back("the chapters are left out: " + Ending(m_format) + " has none");
        }
        Add(m_plan.maps,
            {"-map_metadata", "1", "-map_chapters", m_container.chapters ? "1" : "-1"});
        for (const auto& [name, value] : m_info.tags) {
            std::string tag = name;
            tag += "=";
            tag += value;
            Add(m_plan.maps, {"-metadata:s:v:0", tag});
        }
        return std::move(m_plan);
    }

private:
    void Map(const StreamInfo& stream) {
        Add(m_plan.maps, {"-map", "1:" + std::to_string(stream.index)});
    }

    void Lose(const StreamInfo& stream, const std::string& why) {
        const std::string kind = stream.isCover                          ? "cover picture"
                                 : stream.kind == StreamKind::Video      ? "further video"
                                 : stream.kind == StreamKind::Audio      ? "sound"
                                 : stream.kind == StreamKind::Subtitle   ? "subtitle track"
                                 : stream.kind == StreamKind::Attachment ? "attachment"
                                                                         : "data track";
        m_plan.losses.push_back("stream " + std::to_string(stream.index) + ", a " + kind + " (" +
                                stream.codec + "), is left out: it " + why);
    }

    void Carry(const StreamInfo& stream) {
        const std::string cannot = "does not go into " + Ending(m_format);
        switch (stream.kind) {
        case StreamKind::Audio:
            return m_container.soundCodec ? CarrySound(stream) : Lose(stream, cannot);
        case StreamKind::Subtitle:
            return CarrySubtitle(stream, cannot);
        case StreamKind::Video:
            if (stream.isCover && m_container.covers) {
                Map(stream);
                const std::string number = std::to_string(++m_nVideos);
                Add(m_plan.maps,
                    {"-c:v:" + number, "copy", "-disposition:v:" + number, "attached_pic"});
                return;
            }
            return Lose(stream, stream.isCover ? cannot : "is not the one that is rendered");
        case StreamKind::Attachment:
            if (m_container.attachments) {
                Map(stream);
                Add(m_plan.maps, {"-c:t", "copy"});
                return;
            }
            return Lose(stream, cannot);
        case StreamKind::Data: {
            // A track that only repeats the time code, which is carried as a label.
            const bool isTimeCode =
                stream.codec == "tmcd" &&
                std::any_of(m_info.tags.begin(), m_info.tags.end(),
                            [](const auto& tag) { return tag.first == "timecode"; });
            // Chapters of .mp4 are a track as well.
            if (!isTimeCode && !(stream.codec == "bin_data" && m_info.chapters > 0)) {
                Lose(stream, "is of a kind that is not carried");
            }
            return;
        }
        }
    }

    void CarrySound(const StreamInfo& stream) {
        const std::string number = std::to_string(m_nSounds++);
        const bool fits = Holds(m_container.sounds, stream.codec);
        Map(stream);
        Add(m_plan.maps, {"-c:a:" + number, fits ? "copy" : m_container.soundCodec});
        if (!fits) {
            Add(m_plan.maps, {"-b:a:" + number, "192k"});
            m_plan.losses.push_back("the sound becomes " + SoundTitle() + "; " + Ending(m_format) +
                                    " cannot hold " + stream.codec);
        }
    }

    void CarrySubtitle(const StreamInfo& stream, const std::string& cannot) {
        const bool fits = Holds(m_container.subtitles, stream.codec);
        if (!fits && !(m_container.textCodec && IsTextSubtitle(stream.codec))) {
            return Lose(stream, cannot);
        }
        const std::string number = std::to_string(m_nSubtitles++);
        Map(stream);
        Add(m_plan.maps, {"-c:s:" + number, fits ? "copy" : m_container.textCodec});
        if (!fits && (stream.codec == "ass" || stream.codec == "ssa")) {
            m_plan.losses.push_back("subtitles lose their styles; " + Ending(m_format) +
                                    " cannot hold " + stream.codec);
        }
    }

    std::string SoundTitle() const {
        const std::string codec = m_container.soundCodec;
        return codec == "aac"          ? "AAC"
               : codec == "libopus"    ? "Opus"
               : codec == "libmp3lame" ? "MP3"
                                       : codec;
    }

    const VideoFormat& m_format;
    const Container& m_container;
    const VideoInfo& m_info;
    Plan m_plan;
    int m_nVideos = 0, m_nSounds = 0, m_nSubtitles = 0;
};

Plan PlanFor(const VideoFormat& format) {
    return format.carried ? CPlanner(format).Make() : Plan{};
}

// 4:2:0 needs even sides: an odd picture gets its last column or row twice.
bool NeedsPadding(const VideoFormat& format) {
    return format.codec->evenSides && (format.width % 2 != 0 || format.height % 2 != 0);
}

std::string Padding(const VideoFormat& format) {
    const uint32_t right = format.width % 2, bottom = format.height % 2;
    return "pad=" + std::to_string(format.width + right) + ":" +
           std::to_string(format.height + bottom) + ",fillborders=right=" + std::to_string(right) +
           ":bottom=" + std::to_string(bottom) + ":mode=smear,";
}

bool IsInterlaced(const VideoFormat& format) {
    return format.fields != FieldOrder::Progressive;
}

const char* Pixels(const VideoFormat& format) {
    const Codec& codec = *format.codec;
    return format.alpha && codec.alphaPixels           ? codec.alphaPixels
           : format.labels.IsHdr() && codec.deepPixels ? codec.deepPixels
                                                       : codec.pixels;
}

// The matrix by the name that the scaler has for it; null for those that it cannot make.
const char* ScalerMatrix(const std::string& label) {
    constexpr std::pair<const char*, const char*> kNames[] = {
        {"bt709", "bt709"},         {"smpte170m", "bt601"}, {"bt470bg", "bt601"},
        {"smpte240m", "smpte240m"}, {"fcc", "fcc"},         {"bt2020nc", "bt2020"}};
    for (const auto& [from, to] : kNames) {
        if (label == from) {
            return to;
        }
    }
    return nullptr;
}

// The labels that are written: those of the source, and for the rest what its matrix goes with.
ColorLabels WrittenLabels(const VideoFormat& format) {
    const std::string usual = format.isBt709 ? "bt709" : "smpte170m";
    ColorLabels labels = format.labels;
    if (!format.codec->isYuv) {
        labels.matrix.clear(); // the pixels are RGB
        return labels;
    }
    if (!ScalerMatrix(labels.matrix)) {
        labels.matrix = usual;
    }
    const bool isOld =
        labels.matrix == "bt709" || labels.matrix == "smpte170m" || labels.matrix == "bt470bg";
    if (isOld && labels.primaries.empty()) {
        labels.primaries = labels.matrix;
    }
    if (isOld && labels.transfer.empty()) {
        labels.transfer = labels.matrix == "bt709" ? "bt709" : "smpte170m";
    }
    return labels;
}

std::string Filters(const VideoFormat& format) {
    const ColorLabels labels = WrittenLabels(format);
    std::string filters = NeedsPadding(format) ? Padding(format) : "";
    if (format.codec->isYuv) {
        filters += "scale=flags=bicubic+accurate_rnd+full_chroma_int:out_range=tv:"
                   "out_color_matrix=" +
                   std::string(ScalerMatrix(labels.matrix)) +
                   (IsInterlaced(format) ? ":interl=1" : "") + ",";
    }
    if (std::string_view(format.codec->name) == "gif") {
        // A palette for every frame: nothing has to be kept until the end.
        return "split[a][b];[a]palettegen=stats_mode=single[p];[b][p]paletteuse=new=1";
    }
    filters += "format=" + std::string(Pixels(format)) + ",setsar=" + TextOf(format.sampleAspect);
    // Some encoders go by the frames, not by what they are told.
    const auto set = [&](const char* name, const std::string& value) {
        filters += value.empty() ? "" : std::string(",setparams=") + name + "=" + value;
    };
    set("field_mode", format.fields == FieldOrder::TopFirst      ? "tff"
                      : format.fields == FieldOrder::BottomFirst ? "bff"
                                                                 : "");
    set("color_primaries", labels.primaries);
    set("color_trc", labels.transfer);
    return filters;
}

Arguments EncoderArguments(const VideoFormat& format) {
    Arguments arguments = {"-filter:v:0", Filters(format)};
    for (const std::string& argument : format.codec->encoder) {
        arguments.push_back(argument == "-c:v" ? "-c:v:0" : argument);
    }
    if (IsInterlaced(format)) {
        Add(arguments, format.codec->interlaced);
    }
    const ColorLabels labels = WrittenLabels(format);
    const auto label = [&](const char* option, const std::string& value) {
        if (!value.empty()) {
            Add(arguments, {option, value});
        }
    };
    if (format.codec->isYuv) {
        label("-color_range", "tv");
        label("-colorspace", labels.matrix);
    }
    label("-color_primaries", labels.primaries);
    label("-color_trc", labels.transfer);
    if (std::string_view(format.codec->name) == "h265" && format.container->covers) {
        Add(arguments, {"-tag:v:0", "hvc1"}); // some players look for it
    }
    if (format.container->times == Times::Constant) {
        Add(arguments, {"-fps_mode:v:0", "cfr", "-r:v:0", TextOf(format.rate)});
    } else {
        Add(arguments, {"-fps_mode:v:0", "passthrough", "-enc_time_base:v:0", TextOf(format.tick)});
    }
    return arguments;
}

// Inputs 1 and 2, or only 1 when one clip is silent, mixed into one track.
Arguments JoinArguments(const SoundJoin& join, const char* codec) {
    const std::string overlap = Decimal(join.overlapSeconds);
    const std::string meeting = Decimal(join.firstSeconds - join.overlapSeconds);
    // Both tracks get the length of their pictures.
    const std::string first = "[1:a:0]apad,atrim=0:" + Decimal(join.firstSeconds);
    const std::string second = std::string(join.first.empty() ? "[1" : "[2") +
                               ":a:0]apad,atrim=0:" + Decimal(join.secondSeconds);
    std::string filter;
    if (join.second.empty()) {
        filter = first + ",afade=t=out:st=" + meeting + ":d=" + overlap + "[s]";
    } else if (join.first.empty()) {
        filter = second + ",afade=t=in:d=" + overlap +
                 ",adelay=delays=" + Decimal((join.firstSeconds - join.overlapSeconds) * 1000) +
                 ":all=1[s]";
    } else {
        filter = first + "[a];" + second + "[b];[a][b]acrossfade=d=" + overlap + "[s]";
    }
    Arguments arguments;
    for (const fs::path& file : {join.first, join.second}) {
        if (!file.empty()) {
            Add(arguments, {"-i", "file:" + TextOf(file)});
        }
    }
    Add(arguments, {"-filter_complex", filter, "-map", "0:v:0", "-map", "[s]", "-c:a", codec});
    return arguments;
}

Arguments CarriedArguments(const VideoFormat& format) {
    const CarriedSource& carried = *format.carried;
    Arguments arguments;
    if (carried.start > 0) {
        Add(arguments, {"-ss", Decimal(carried.start)});
    }
    if (carried.seconds > 0) {
        Add(arguments, {"-t", Decimal(format.startSeconds + carried.seconds)});
    }
    Add(arguments, carried.input.options);
    Add(arguments, {"-i", carried.input.Argument(), "-map", "0:v:0"});
    Add(arguments, PlanFor(format).maps);
    // Else the copied sound would begin where the file can be entered, before the start.
    Add(arguments, {"-copypriorss:a", "0"});
    return arguments;
}

Arguments WriterArguments(const fs::path& file, const VideoFormat& format) {
    Arguments arguments = {"-v", "error", "-y", "-itsoffset", Decimal(format.startSeconds)};
    Add(arguments, {"-thread_queue_size", "8", "-f", "matroska", "-i", "pipe:0"});
    if (format.join && !(format.join->first.empty() && format.join->second.empty())) {
        const bool isLossless = !format.codec->isYuv;
        const char* const codec = format.container->soundCodec;
        Add(arguments,
            JoinArguments(*format.join, isLossless                               ? codec
                                        : Holds(format.container->sounds, "aac") ? "aac"
                                                                                 : codec));
    } else if (format.carried && !format.carried->input.pipe) {
        Add(arguments, CarriedArguments(format));
    }
    Add(arguments, EncoderArguments(format));
    if (format.container->covers) { // the family of .mp4
        Add(arguments,
            {"-movflags", "+faststart", "-video_track_timescale", std::to_string(format.tick.den)});
    }
    Add(arguments, format.options);
    Add(arguments, {"-f", format.container->muxer, OutputArgument(file)});
    return arguments;
}

} // namespace

std::vector<std::string> Losses(const VideoFormat& format) {
    std::vector<std::string> losses = PlanFor(format).losses;
    const std::string title = format.codec->title;
    if (format.carried) {
        const VideoInfo& info = format.carried->info;
        if (info.bits > 8) {
            losses.push_back("effects work with 8 bits a component; the video has " +
                             std::to_string(info.bits));
        }
        if (!info.hdrMetadata.empty()) {
            losses.push_back("what the video tells about its mastering is left out (" +
                             info.hdrMetadata + ")");
        }
        if (!info.isRegular && format.container->times == Times::Constant) {
            losses.push_back("frames come at varying times and are repeated or dropped for " +
                             Ending(format) + " to keep pace");
        }
    }
    if (format.alpha && !format.codec->alphaPixels) {
        losses.push_back("alpha is left out: " + title + " has none; .mov, .mkv and .webm keep it");
    }
    if (NeedsPadding(format)) {
        losses.push_back("the picture is " + std::to_string(format.width) + " x " +
                         std::to_string(format.height) + " and becomes " +
                         std::to_string(format.width + format.width % 2) + " x " +
                         std::to_string(format.height + format.height % 2) + ": " + title +
                         " needs even sides; --codec vp9 or ffv1 keeps it");
    }
    if (IsInterlaced(format) && format.codec->interlaced.empty() && format.codec->isYuv) {
        losses.push_back("the fields stay apart but are coded as whole frames: " + title +
                         " has no interlaced coding here");
    }
    if (!ScalerMatrix(format.labels.matrix) && !format.labels.matrix.empty() &&
        format.codec->isYuv) {
        losses.push_back("the matrix becomes " + WrittenLabels(format).matrix + "; " +
                         format.labels.matrix + " cannot be written");
    }
    return losses;
}

CVideoWriter::CVideoWriter(const VideoTools& tools, const fs::path& file, const VideoFormat& format)
    : m_argument(OutputArgument(file)), m_frameBytes(size_t{format.width} * format.height * 4) {
    if (m_frameBytes > kMostFrameBytes) {
        throw CHostError(ExitStatus::RenderingFailed,
                         "frames of videos have at most 67 megapixels");
    }
    const bool plays = !format.playerTitle.empty();
    m_pFfmpeg = std::make_unique<CFfmpeg>(tools.ffmpeg, tools.Option(),
                                          WriterArguments(file, format), ChildStream::Pipe,
                                          plays          ? ChildStream::Pipe
                                          : IsDash(file) ? ChildStream::Own
                                                         : ChildStream::Null,
                                          ExitStatus::RenderingFailed);
    if (plays) {
        m_pPlayer = std::make_unique<CPlayer>(tools, format.playerTitle, m_pFfmpeg->Process());
    }
    const std::vector<uint8_t> header = FrameStreamHeader(format.width, format.height, format.rate);
    if (!m_pFfmpeg->Process().WriteInput(header.data(), header.size())) {
        Fail();
    }
}

CVideoWriter::~CVideoWriter() = default;

void CVideoWriter::Write(const uint8_t* frame, int64_t nanoseconds) {
    const std::vector<uint8_t> header = FrameHeader(nanoseconds, m_frameBytes);
    if (!m_pFfmpeg->Process().WriteInput(header.data(), header.size()) ||
        !m_pFfmpeg->Process().WriteInput(frame, m_frameBytes)) {
        Fail();
    }
}

void CVideoWriter::Finish() {
    m_pFfmpeg->Process().CloseInput();
    // A disk that fills up with the very last bytes is told in words alone.
    if (m_pFfmpeg->Wait() != 0 || m_pFfmpeg->HasNamed(m_argument)) {
        Fail();
    }
    if (m_pPlayer) {
        m_pPlayer->Finish();
    }
}

void CVideoWriter::Abort() {
    m_pFfmpeg->Process().Kill();
}

void CVideoWriter::Fail() {
    if (m_pPlayer) {
        m_pPlayer->ThrowIfEnded();
    }
    const int status = m_pFfmpeg->Wait();
    const std::string line = m_pFfmpeg->LastLineAbout(m_argument);
    throw CHostError(ExitStatus::RenderingFailed,
                     "ffmpeg stopped writing the video: " +
                         (line.empty() ? "it ended with status " + std::to_string(status) : line));
}

} // namespace kyvhost
