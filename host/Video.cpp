// Videos through ffmpeg.
#include "host/Video.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include <nlohmann/json.hpp>

#include "host/ExitStatus.h"
#include "host/Ffmpeg.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;
using kyv::ChildStream;
using nlohmann::json;

using Arguments = std::vector<std::string>;

// With its protocol, so that a name with a colon or a leading dash is a file all the same.
std::string FileArgument(const fs::path& file) {
    return "file:" + TextOf(file);
}

std::string Decimal(double number) {
    char text[64];
    std::snprintf(text, sizeof text, "%.6f", number);
    return text;
}

std::string SizeText(uint32_t width, uint32_t height) {
    return std::to_string(width) + "x" + std::to_string(height);
}

[[noreturn]] void Unreadable(const fs::path& file, const std::string& why) {
    throw CHostError(ExitStatus::InputUnreadable, TextOf(file) + ": " + why);
}

// ffmpeg names the file in its last line; the user's line has it already, under its final name.
std::string WithoutFileName(const std::string& line, const fs::path& file) {
    const std::string prefix = FileArgument(file) + ": ";
    const size_t at = line.find(prefix);
    return at == std::string::npos ? line : line.substr(at + prefix.size());
}

// A member that ffprobe writes as text; the fallback when it is missing.
std::string Text(const json& object, const char* name, const std::string& fallback = "") {
    const auto member = object.find(name);
    return member != object.end() && member->is_string() ? member->get<std::string>() : fallback;
}

double NumberIn(const json& object, const char* name, double fallback) {
    const std::string text = Text(object, name);
    char* end = nullptr;
    const double number = std::strtod(text.c_str(), &end);
    return text.empty() || end == text.c_str() || !std::isfinite(number) ? fallback : number;
}

// "30000/1001" or "4:3"; 0/1 when it is neither.
Rational RatioIn(const json& object, const char* name, char separator) {
    const std::vector<std::string> parts = Split(Text(object, name), separator);
    if (parts.size() != 2) {
        return {0, 1};
    }
    const Rational ratio = {std::atoll(parts[0].c_str()), std::atoll(parts[1].c_str())};
    return ratio.num > 0 && ratio.den > 0 ? ratio : Rational{0, 1};
}

// The rate that the stream's time stamps are made for, where the average agrees but for what a
// short clip or coarse time stamps do to it; else the average, so that a varying rate keeps pace.
Rational FrameRate(const json& stream) {
    const Rational average = RatioIn(stream, "avg_frame_rate", '/');
    const Rational base = RatioIn(stream, "r_frame_rate", '/');
    if (average.num == 0) {
        return base;
    }
    const bool agree =
        base.num != 0 && std::abs(base.Value() - average.Value()) <= 0.005 * average.Value();
    return agree ? base : average;
}

// Quarter turns, from the display matrix or the older tag.
int QuarterTurns(const json& stream) {
    double degrees = 0;
    if (const auto tags = stream.find("tags"); tags != stream.end()) {
        degrees = NumberIn(*tags, "rotate", 0);
    }
    if (const auto list = stream.find("side_data_list"); list != stream.end()) {
        for (const json& item : *list) {
            if (const auto rotation = item.find("rotation");
                rotation != item.end() && rotation->is_number()) {
                degrees = rotation->get<double>();
            }
        }
    }
    return static_cast<int>(std::lround(degrees / 90)) & 3;
}

VideoInfo ParseProbe(const fs::path& file, const json& probe) {
    VideoInfo info;
    const json streams = probe.value("streams", json::array());
    const json* video = nullptr;
    for (const json& stream : streams) {
        const std::string type = Text(stream, "codec_type");
        const bool isCover =
            stream.contains("disposition") && stream["disposition"].value("attached_pic", 0) != 0;
        if (type == "audio") {
            info.audioCodecs.push_back(Text(stream, "codec_name", "unknown"));
        } else if (type == "video" && !video && !isCover) {
            video = &stream;
        }
    }
    if (!video) {
        Unreadable(file, "this is no picture, and no video stream is in it");
    }
    info.streamIndex = video->value("index", 0);
    info.width = video->value("width", 0U);
    info.height = video->value("height", 0U);
    info.rate = FrameRate(*video);
    if (info.width == 0 || info.height == 0 || info.rate.num == 0) {
        Unreadable(file, "the video stream tells neither size nor frame rate");
    }
    if (const Rational aspect = RatioIn(*video, "sample_aspect_ratio", ':'); aspect.num != 0) {
        info.sampleAspect = aspect;
    }
    if (QuarterTurns(*video) & 1) {
        std::swap(info.width, info.height);
        std::swap(info.sampleAspect.num, info.sampleAspect.den);
    }
    const json format = probe.value("format", json::object());
    info.startSeconds =
        std::max(0.0, NumberIn(*video, "start_time", 0) - NumberIn(format, "start_time", 0));
    const double duration = NumberIn(*video, "duration", NumberIn(format, "duration", 0));
    info.frameCount = std::llround(NumberIn(*video, "nb_frames", duration * info.rate.Value()));

    const std::string matrix = Text(*video, "color_space", "unknown");
    info.hasMatrixTag = matrix != "unknown" && matrix != "gbr";
    // Without a tag players go by the size.
    info.isBt709 =
        info.hasMatrixTag ? matrix == "bt709" || matrix.starts_with("bt2020") : info.height >= 720;
    return info;
}

std::string Extension(const fs::path& file) {
    return Lower(TextOf(file.extension()));
}

bool Holds(const std::string& extension, const std::string& audioCodec) {
    if (extension == ".mkv") {
        return true;
    }
    std::vector<std::string> codecs = {"aac", "mp3", "ac3", "eac3", "alac"};
    if (extension == ".mov") {
        codecs.insert(codecs.end(), {"pcm_s16le", "pcm_s16be", "pcm_s24le", "pcm_s24be",
                                     "pcm_s32le", "pcm_f32le", "pcm_u8"});
    } else {
        codecs.insert(codecs.end(), {"opus", "flac"});
    }
    return std::find(codecs.begin(), codecs.end(), audioCodec) != codecs.end();
}

const char* Muxer(const fs::path& file) {
    const std::string extension = Extension(file);
    return extension == ".mkv" ? "matroska" : extension == ".mov" ? "mov" : "mp4";
}

// 4:2:0 needs even sides: an odd picture gets its last column or row twice.
std::string EvenSides(uint32_t width, uint32_t height) {
    if (width % 2 == 0 && height % 2 == 0) {
        return "";
    }
    return "pad=" + std::to_string(width + width % 2) + ":" + std::to_string(height + height % 2) +
           ",fillborders=right=" + std::to_string(width % 2) +
           ":bottom=" + std::to_string(height % 2) + ":mode=smear,";
}

Arguments EncoderArguments(const VideoFormat& format) {
    const std::string shape = "setsar=" + TextOf(format.sampleAspect);
    if (format.codec == VideoCodec::Ffv1) {
        return {"-vf", shape, "-c:v", "ffv1", "-level", "3", "-pix_fmt", "bgra"};
    }
    const std::string matrix = format.isBt709 ? "bt709" : "smpte170m";
    return {"-vf",
            EvenSides(format.width, format.height) +
                "scale=flags=bicubic+accurate_rnd+full_chroma_int:out_range=tv:out_color_matrix=" +
                (format.isBt709 ? "bt709" : "bt601") + ",format=yuv420p," + shape,
            "-c:v",
            "libx264",
            "-crf",
            "18",
            "-color_range",
            "tv",
            "-colorspace",
            matrix,
            "-color_primaries",
            matrix,
            "-color_trc",
            matrix};
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
            arguments.insert(arguments.end(), {"-i", FileArgument(file)});
        }
    }
    arguments.insert(arguments.end(),
                     {"-filter_complex", filter, "-map", "0:v:0", "-map", "[s]", "-c:a", codec});
    return arguments;
}

Arguments WriterArguments(const fs::path& file, const VideoFormat& format) {
    Arguments arguments = {"-v", "error", "-nostdin", "-y"};
    const auto add = [&](const Arguments& more) {
        arguments.insert(arguments.end(), more.begin(), more.end());
    };
    add({"-itsoffset", Decimal(format.startSeconds), "-f", "rawvideo", "-pix_fmt", "bgra"});
    add({"-video_size", SizeText(format.width, format.height)});
    add({"-framerate", TextOf(format.rate), "-thread_queue_size", "8", "-i", "pipe:0"});
    if (format.join && !(format.join->first.empty() && format.join->second.empty())) {
        add(JoinArguments(*format.join, format.codec == VideoCodec::Ffv1 ? "flac" : "aac"));
    } else if (!format.soundFile.empty()) {
        if (format.soundStart > 0) {
            add({"-ss", Decimal(format.soundStart)});
        }
        if (format.soundSeconds > 0) {
            add({"-t", Decimal(format.startSeconds + format.soundSeconds)});
        }
        add({"-i", FileArgument(format.soundFile), "-map", "0:v:0", "-map", "1:a?"});
        add({"-map_metadata", "1"});
        // Else the copied sound would begin where the file can be entered, before the start.
        add({"-copypriorss:a", "0"});
        for (size_t i = 0; i < format.audioCodecs.size(); ++i) {
            const bool fits = Holds(Extension(file), format.audioCodecs[i]);
            add({"-c:a:" + std::to_string(i), fits ? "copy" : "aac"});
            if (!fits) {
                add({"-b:a:" + std::to_string(i), "192k"});
            }
        }
    }
    add(EncoderArguments(format));
    if (Extension(file) != ".mkv") {
        add({"-movflags", "+faststart"});
    }
    add({"-f", Muxer(file), FileArgument(file)});
    return arguments;
}

} // namespace

std::string VideoTools::Ffprobe() const {
    const fs::path program = PathOf(ffmpeg);
    fs::path probe = program.parent_path() / "ffprobe";
    probe += program.extension();
    return TextOf(probe);
}

VideoInfo ProbeVideo(const VideoTools& tools, const fs::path& file) {
    CFfmpeg probe(tools.Ffprobe(), tools.Option(),
                  {"-v", "error", "-print_format", "json", "-show_streams", "-show_format",
                   FileArgument(file)},
                  ChildStream::Null, ChildStream::Pipe, ExitStatus::InputUnreadable);
    std::string text;
    char buffer[4096];
    while (const size_t count = probe.Process().ReadOutput(buffer, sizeof buffer)) {
        text.append(buffer, count);
    }
    if (probe.Wait() != 0) {
        Unreadable(file, "this is no picture or video that can be read (" +
                             WithoutFileName(probe.LastLine(), file) + ")");
    }
    try {
        return ParseProbe(file, json::parse(text));
    } catch (const json::exception&) {
        Unreadable(file, tools.Ffprobe() + " describes it in no way that this host understands");
    }
}

CVideoReader::CVideoReader(const VideoTools& tools, const fs::path& file, const VideoInfo& info,
                           uint32_t width, uint32_t height, const Rational& rate,
                           double startSeconds)
    : m_file(file), m_frameBytes(size_t{width} * height * 4) {
    std::string scale = "scale=" + std::to_string(width) + ":" + std::to_string(height) +
                        ":flags=bicubic+accurate_rnd+full_chroma_int+full_chroma_inp";
    if (!info.hasMatrixTag) {
        scale += std::string(":in_color_matrix=") + (info.isBt709 ? "bt709" : "bt601");
    }
    Arguments arguments = {"-v", "error", "-nostdin"};
    if (startSeconds > 0) {
        arguments.insert(arguments.end(), {"-ss", Decimal(startSeconds)});
    }
    // The scaling also holds frames to one size when the stream changes its own.
    arguments.insert(arguments.end(),
                     {"-i", FileArgument(file), "-map", "0:" + std::to_string(info.streamIndex),
                      "-vf", "fps=" + TextOf(rate) + "," + scale, "-f", "rawvideo", "-pix_fmt",
                      "bgra", "pipe:1"});
    m_pFfmpeg =
        std::make_unique<CFfmpeg>(tools.ffmpeg, tools.Option(), arguments, ChildStream::Null,
                                  ChildStream::Pipe, ExitStatus::InputUnreadable);
}

CVideoReader::~CVideoReader() = default;

bool CVideoReader::Read(uint8_t* frame) {
    size_t have = 0;
    while (have < m_frameBytes) {
        const size_t count = m_pFfmpeg->Process().ReadOutput(frame + have, m_frameBytes - have);
        if (count == 0) {
            break;
        }
        have += count;
    }
    if (have == m_frameBytes) {
        ++m_nFrames;
        return true;
    }
    const int status = m_pFfmpeg->Wait();
    if (status != 0 || have != 0) {
        Unreadable(m_file, "ffmpeg stopped reading after frame " + std::to_string(m_nFrames) +
                               " (" + WithoutFileName(m_pFfmpeg->LastLine(), m_file) + ")");
    }
    if (const std::string line = m_pFfmpeg->LastLine(); !line.empty()) {
        std::fprintf(stderr, "kyvhost: note: %s is damaged: %s\n", TextOf(m_file).c_str(),
                     line.c_str());
    }
    return false;
}

void CVideoReader::Abort() {
    m_pFfmpeg->Process().Kill();
}

bool IsVideoName(const fs::path& file) {
    const std::string extension = Extension(file);
    return extension == ".mp4" || extension == ".m4v" || extension == ".mov" || extension == ".mkv";
}

void CheckContainer(const fs::path& file, VideoCodec codec) {
    if (codec == VideoCodec::Ffv1 && Extension(file) != ".mkv") {
        throw CUsageError(TextOf(file) + ": FFV1 goes into .mkv files");
    }
}

std::vector<std::string> RecodedAudio(const fs::path& file,
                                      const std::vector<std::string>& codecs) {
    std::vector<std::string> recoded;
    for (const std::string& codec : codecs) {
        if (!Holds(Extension(file), codec)) {
            recoded.push_back(codec);
        }
    }
    return recoded;
}

CVideoWriter::CVideoWriter(const VideoTools& tools, const fs::path& file, const VideoFormat& format)
    : m_file(file), m_frameBytes(size_t{format.width} * format.height * 4),
      m_pFfmpeg(std::make_unique<CFfmpeg>(tools.ffmpeg, tools.Option(),
                                          WriterArguments(file, format), ChildStream::Pipe,
                                          ChildStream::Null, ExitStatus::RenderingFailed)) {}

CVideoWriter::~CVideoWriter() = default;

void CVideoWriter::Write(const uint8_t* frame) {
    if (!m_pFfmpeg->Process().WriteInput(frame, m_frameBytes)) {
        Fail();
    }
}

void CVideoWriter::Finish() {
    m_pFfmpeg->Process().CloseInput();
    // A disk that fills up with the very last bytes is told in words alone.
    if (m_pFfmpeg->Wait() != 0 || m_pFfmpeg->HasNamed(FileArgument(m_file))) {
        Fail();
    }
}

void CVideoWriter::Abort() {
    m_pFfmpeg->Process().Kill();
}

void CVideoWriter::Fail() {
    const int status = m_pFfmpeg->Wait();
    const std::string line = WithoutFileName(m_pFfmpeg->LastLine(), m_file);
    throw CHostError(ExitStatus::RenderingFailed,
                     "ffmpeg stopped writing the video: " +
                         (line.empty() ? "it ended with status " + std::to_string(status) : line));
}

} // namespace kyvhost
