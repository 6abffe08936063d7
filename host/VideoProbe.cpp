// Probing through ffprobe.
#include "host/VideoProbe.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdlib>

#include <nlohmann/json.hpp>

#include "host/ExitStatus.h"
#include "host/Ffmpeg.h"
#include "host/FileNames.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;
using kyv::ChildStream;
using nlohmann::json;

[[noreturn]] void Unreadable(const MediaInput& input, const std::string& why) {
    throw CHostError(ExitStatus::InputUnreadable, TextOf(input.file) + ": " + why);
}

// A member that ffprobe writes as text; the fallback when it is missing.
std::string Text(const json& object, const char* name, const std::string& fallback = "") {
    const auto member = object.find(name);
    return member != object.end() && member->is_string() ? member->get<std::string>() : fallback;
}

// A label of the colours, of which some programs write empty ones.
std::string Label(const json& stream, const char* name) {
    const std::string label = Text(stream, name);
    return label == "unknown" || label == "reserved" || label == "gbr" ? "" : label;
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
void SetRate(const json& stream, VideoInfo& info) {
    const Rational average = RatioIn(stream, "avg_frame_rate", '/');
    const Rational base = RatioIn(stream, "r_frame_rate", '/');
    info.isRegular =
        average.num == 0 ||
        (base.num != 0 && std::abs(base.Value() - average.Value()) <= 0.005 * average.Value());
    info.rate = info.isRegular ? base : average;
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

std::string HdrMetadata(const json& stream) {
    std::vector<std::string> kinds;
    if (const auto list = stream.find("side_data_list"); list != stream.end()) {
        for (const json& item : *list) {
            const std::string type = Text(item, "side_data_type");
            if (type.starts_with("Mastering") || type.starts_with("Content light") ||
                type.starts_with("DOVI")) {
                kinds.push_back(Lower(type));
            }
        }
    }
    return Join(kinds, ", ");
}

// Bits of a component and alpha, from the name of a pixel format such as yuva444p10le.
void SetPixelFormat(const json& stream, VideoInfo& info) {
    const std::string& format = info.pixelFormat = Text(stream, "pix_fmt");
    const std::string raw = Text(stream, "bits_per_raw_sample");
    info.bits = std::max(8, std::atoi(raw.c_str()));
    for (const int bits : {9, 10, 12, 14, 16}) {
        const std::string number = std::to_string(bits);
        if (format.ends_with(number + "le") || format.ends_with(number + "be")) {
            info.bits = std::max(info.bits, bits);
        }
    }
    if (format.starts_with("rgb48") || format.starts_with("rgba64") || format.starts_with("p016") ||
        format.starts_with("gbrpf") || format.starts_with("gbrapf")) {
        info.bits = 16;
    } else if (format.starts_with("p010") || format.starts_with("x2")) {
        info.bits = 10;
    }
    constexpr std::array kAlpha = {"yuva", "rgba", "argb",  "bgra", "abgr",
                                   "ya8",  "ya16", "gbrap", "ayuv", "pal8"};
    info.hasAlpha = std::any_of(kAlpha.begin(), kAlpha.end(),
                                [&](const char* start) { return format.starts_with(start); });
    if (const auto tags = stream.find("tags"); tags != stream.end()) {
        // WebM keeps alpha in a second stream of its own that only one decoder reads.
        info.hasAlpha =
            info.hasAlpha || Text(*tags, "alpha_mode") == "1" || Text(*tags, "ALPHA_MODE") == "1";
        for (const auto& [name, value] : tags->items()) {
            constexpr std::array kKept = {"language", "title", "timecode", "handler_name"};
            if (value.is_string() &&
                std::find(kKept.begin(), kKept.end(), Lower(name)) != kKept.end()) {
                info.tags.emplace_back(Lower(name), value.get<std::string>());
            }
        }
    }
}

StreamKind KindOfStream(const std::string& type) {
    return type == "video"        ? StreamKind::Video
           : type == "audio"      ? StreamKind::Audio
           : type == "subtitle"   ? StreamKind::Subtitle
           : type == "attachment" ? StreamKind::Attachment
                                  : StreamKind::Data;
}

bool IsPictureFormat(const std::string& format) {
    return format.ends_with("_pipe") || format == "image2";
}

// The first video stream; the others go into info.
const json* FindVideo(const json& streams, VideoInfo& info) {
    const json* video = nullptr;
    for (const json& stream : streams) {
        StreamInfo other;
        other.index = stream.value("index", 0);
        other.kind = KindOfStream(Text(stream, "codec_type"));
        other.codec = Text(stream, "codec_name", Text(stream, "codec_tag_string", "unknown"));
        other.isCover =
            stream.contains("disposition") && stream["disposition"].value("attached_pic", 0) != 0;
        if (other.kind == StreamKind::Video && !video && !other.isCover) {
            video = &stream;
            info.codec = other.codec;
        } else {
            info.others.push_back(other);
        }
    }
    return video;
}

void SetTimes(const json& video, const json& format, VideoInfo& info) {
    if (const Rational base = RatioIn(video, "time_base", '/'); base.num != 0) {
        info.timeBase = base;
    }
    info.startSeconds =
        std::max(0.0, NumberIn(video, "start_time", 0) - NumberIn(format, "start_time", 0));
    info.seconds = std::max(0.0, NumberIn(video, "duration", NumberIn(format, "duration", 0)));
    info.frameCount = std::llround(NumberIn(video, "nb_frames", info.seconds * info.rate.Value()));
    if (info.seconds == 0 || info.isRegular) { // whole frames, however coarse the duration is
        info.seconds = static_cast<double>(info.frameCount) / info.rate.Value();
    }
}

VideoInfo ParseProbe(const MediaInput& input, const json& probe) {
    VideoInfo info;
    const json streams = probe.value("streams", json::array());
    const json format = probe.value("format", json::object());
    const json* const video = FindVideo(streams, info);
    if (!video) {
        Unreadable(input, "this is no picture, and no video stream is in it");
    }
    info.streamIndex = video->value("index", 0);
    info.width = video->value("width", 0U);
    info.height = video->value("height", 0U);
    SetRate(*video, info);
    if (info.width == 0 || info.height == 0 || info.rate.num == 0) {
        Unreadable(input, "the video stream tells neither size nor frame rate");
    }
    info.isStill = !input.isSequence && IsPictureFormat(Text(format, "format_name"));
    if (const Rational aspect = RatioIn(*video, "sample_aspect_ratio", ':'); aspect.num != 0) {
        info.sampleAspect = aspect;
    }
    if (QuarterTurns(*video) & 1) {
        std::swap(info.width, info.height);
        std::swap(info.sampleAspect.num, info.sampleAspect.den);
    }
    SetTimes(*video, format, info);
    SetPixelFormat(*video, info);
    info.labels = {Label(*video, "color_space"), Label(*video, "color_transfer"),
                   Label(*video, "color_primaries")};
    const std::string& matrix = info.labels.matrix;
    // Without a label players go by the size.
    info.isBt709 =
        matrix.empty() ? info.height >= 720 : matrix == "bt709" || matrix.starts_with("bt2020");
    const std::string order = Text(*video, "field_order");
    // Of interleaved rows the first letter tells, in what ffmpeg and its like have written.
    info.fields = order == "tt" || order == "tb"   ? FieldOrder::TopFirst
                  : order == "bb" || order == "bt" ? FieldOrder::BottomFirst
                                                   : FieldOrder::Progressive;
    info.hdrMetadata = HdrMetadata(*video);
    if (const auto tags = format.find("tags"); tags != format.end()) {
        info.hasTitle = !Text(*tags, "title", Text(*tags, "TITLE")).empty();
    }
    info.chapters = probe.value("chapters", json::array()).size();
    return info;
}

// The numbers that files of the pattern have, in order.
std::vector<long> NumbersOf(const fs::path& pattern) {
    const std::string name = TextOf(pattern.filename());
    const size_t percent = name.find('%'), letter = name.find('d', percent);
    const std::string before = name.substr(0, percent), after = name.substr(letter + 1);
    const size_t width =
        static_cast<size_t>(std::atoi(name.substr(percent + 1, letter - percent - 1).c_str()));
    std::vector<long> numbers;
    std::error_code error;
    const fs::path folder = pattern.has_parent_path() ? pattern.parent_path() : fs::path(".");
    for (const fs::directory_entry& entry : fs::directory_iterator(folder, error)) {
        const std::string file = TextOf(entry.path().filename());
        if (file.size() <= before.size() + after.size() || !file.starts_with(before) ||
            !file.ends_with(after)) {
            continue;
        }
        const std::string digits =
            file.substr(before.size(), file.size() - before.size() - after.size());
        if (digits.size() >= width && digits.size() <= 9 &&
            digits.find_first_not_of("0123456789") == std::string::npos) {
            numbers.push_back(std::atol(digits.c_str()));
        }
    }
    std::sort(numbers.begin(), numbers.end());
    return numbers;
}

MediaInput OpenSequence(const fs::path& file, const RawInput& raw) {
    MediaInput input;
    input.file = file;
    input.isSequence = true;
    const std::vector<long> numbers = NumbersOf(file);
    if (numbers.empty()) {
        Unreadable(input, "no file has a name of this form");
    }
    for (size_t i = 1; i < numbers.size(); ++i) {
        if (numbers[i] != numbers[i - 1] + 1) {
            input.warnings.push_back(
                TextOf(file) + " ends at number " + std::to_string(numbers[i - 1]) + "; the " +
                std::to_string(numbers.size() - i) + " files behind the gap are left out");
            break;
        }
    }
    input.options = {"-f",
                     "image2",
                     "-framerate",
                     TextOf(raw.rate.value_or(Rational{30, 1})),
                     "-start_number",
                     std::to_string(numbers.front())};
    return input;
}

// A stream says what it is in its first bytes; raw frames do not, and need a size and a rate.
MediaInput OpenPipe(const fs::path& file, const RawInput& raw) {
    MediaInput input;
    input.file = file;
    input.pipe = std::make_shared<CInputPipe>(file);
    const std::span<const uint8_t> start = input.pipe->Peek(16);
    const std::string_view text(reinterpret_cast<const char*>(start.data()), start.size());
    if (start.empty()) {
        Unreadable(input, "nothing comes in");
    }
    if (raw.size && !text.starts_with("YUV4MPEG2") && !text.starts_with("nut/multimedia")) {
        if (!raw.rate) {
            throw CUsageError("raw frames need --rate beside --size");
        }
        input.options = {"-f",
                         "rawvideo",
                         "-pixel_format",
                         "bgra",
                         "-framerate",
                         TextOf(*raw.rate),
                         "-video_size",
                         std::to_string(raw.size->width) + "x" + std::to_string(raw.size->height)};
    }
    return input;
}

} // namespace

std::string VideoTools::Companion(const char* name) const {
    const fs::path program = PathOf(ffmpeg);
    fs::path companion = program.parent_path() / name;
    companion += program.extension();
    return TextOf(companion);
}

std::string MediaInput::Argument() const {
    return pipe ? "pipe:0" : "file:" + TextOf(file);
}

std::vector<std::string> VideoInfo::AudioCodecs() const {
    std::vector<std::string> codecs;
    for (const StreamInfo& stream : others) {
        if (stream.kind == StreamKind::Audio) {
            codecs.push_back(stream.codec);
        }
    }
    return codecs;
}

MediaInput OpenMedia(const fs::path& file, const RawInput& raw) {
    if (IsPipe(file)) {
        return OpenPipe(file, raw);
    }
    std::error_code error;
    if (IsSequenceName(file) && !fs::exists(file, error)) {
        return OpenSequence(file, raw);
    }
    MediaInput input;
    input.file = file;
    return input;
}

namespace {

// What ffprobe tells when it is asked for something.
json Probed(const VideoTools& tools, const MediaInput& input,
            const std::vector<std::string>& asked) {
    std::vector<std::string> arguments = {"-v", "error", "-print_format", "json"};
    arguments.insert(arguments.end(), asked.begin(), asked.end());
    arguments.insert(arguments.end(), input.options.begin(), input.options.end());
    arguments.insert(arguments.end(), {"-i", input.Argument()});
    const auto probe =
        std::make_shared<CFfmpeg>(tools.Companion("ffprobe"), tools.Option(), arguments,
                                  input.pipe ? ChildStream::Pipe : ChildStream::Null,
                                  ChildStream::Pipe, ExitStatus::InputUnreadable);
    if (input.pipe) {
        FeedFromPipe(probe, input.pipe, true);
    }
    std::string text;
    char buffer[4096];
    while (const size_t count = probe->Process().ReadOutput(buffer, sizeof buffer)) {
        text.append(buffer, count);
    }
    const int status = probe->Wait();
    if (status != 0) {
        Unreadable(input, "this is no picture or video that can be read (" +
                              probe->LastLineAbout(input.Argument()) + ")");
    }
    return json::parse(text);
}

// Streams tell the order of fields in the words of their format, which for some is but a guess;
// frames know.
FieldOrder OrderOfFirstFrame(const VideoTools& tools, const MediaInput& input,
                             const VideoInfo& info) {
    const json probe =
        Probed(tools, input,
               {"-select_streams", std::to_string(info.streamIndex), "-read_intervals", "%+#1",
                "-show_entries", "frame=interlaced_frame,top_field_first"});
    const json frames = probe.value("frames", json::array());
    if (frames.empty() || frames.front().value("interlaced_frame", 0) == 0) {
        return info.fields;
    }
    return frames.front().value("top_field_first", 0) != 0 ? FieldOrder::TopFirst
                                                           : FieldOrder::BottomFirst;
}

} // namespace

VideoInfo ProbeVideo(const VideoTools& tools, const MediaInput& input) {
    try {
        VideoInfo info = ParseProbe(
            input, Probed(tools, input, {"-show_streams", "-show_format", "-show_chapters"}));
        if (info.fields != FieldOrder::Progressive && !input.pipe) {
            info.fields = OrderOfFirstFrame(tools, input, info);
        }
        return info;
    } catch (const json::exception&) {
        Unreadable(input, tools.Companion("ffprobe") +
                              " describes it in no way that this host understands");
    }
}

} // namespace kyvhost
