// What a video file holds, as the program ffprobe tells it.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "host/Arguments.h"
#include "host/InputPipe.h"
#include "host/Rational.h"

namespace kyvhost {

// ffmpeg by the name or path the user gave; its companions lie beside it.
struct VideoTools {
    std::string ffmpeg = "ffmpeg";

    // The user's choice; empty for the installed one.
    std::string Option() const { return ffmpeg == "ffmpeg" ? "" : ffmpeg; }

    // "ffprobe" or "ffplay", in the folder of ffmpeg.
    std::string Companion(const char* name) const;
};

// A file, a numbered sequence of pictures, or a pipe, and how ffmpeg is told to open it.
struct MediaInput {
    std::filesystem::path file;
    std::vector<std::string> options;  // before -i
    std::shared_ptr<CInputPipe> pipe;  // null for what can be opened more than once
    bool isSequence = false;           // of pictures, by a name such as shot-%04d.png
    std::vector<std::string> warnings; // of losses that are seen before the start

    // What follows -i: with its protocol, so that a colon or a leading dash means nothing.
    std::string Argument() const;
};

// What the user has said about an input that does not tell it itself.
struct RawInput {
    std::optional<Size> size; // of raw BGRA frames
    std::optional<Rational> rate;
};

// Finds out what kind of input it is. Throws CHostError.
MediaInput OpenMedia(const std::filesystem::path& file, const RawInput& raw);

enum class StreamKind { Video, Audio, Subtitle, Attachment, Data };

// A stream other than the one that is rendered.
struct StreamInfo {
    int index = 0; // in the file
    StreamKind kind = StreamKind::Data;
    std::string codec;
    bool isCover = false; // a picture that stands for the whole file
};

enum class FieldOrder { Progressive, TopFirst, BottomFirst };

// Labels of the colours as the file has them; empty when it has none.
struct ColorLabels {
    std::string matrix, transfer, primaries;

    bool IsHdr() const { return transfer == "smpte2084" || transfer == "arib-std-b67"; }
};

// A file's first video stream as a player shows it, and what goes with it.
struct VideoInfo {
    int streamIndex = 0;
    std::string codec;
    uint32_t width = 0; // pixels, after the rotation that the file asks for
    uint32_t height = 0;
    Rational rate;               // frames a second; the average when the rate varies
    Rational timeBase{1, 1000};  // seconds a tick of the time stamps
    int64_t frameCount = 0;      // as the file says or its duration gives; 0 when unknown
    double seconds = 0;          // of the stream; 0 when unknown
    double startSeconds = 0;     // of the stream, counted from the start of the file
    Rational sampleAspect{1, 1}; // shape of a pixel
    ColorLabels labels;
    std::string pixelFormat;
    int bits = 8; // of a component
    FieldOrder fields = FieldOrder::Progressive;
    std::string hdrMetadata; // what the file tells about its mastering, for a message; or empty
    std::vector<std::pair<std::string, std::string>> tags; // of the stream: language, title, ...
    std::vector<StreamInfo> others;                        // in the file's order
    size_t chapters = 0;
    bool isStill = false;  // one picture in a format that only ffmpeg knows
    bool isRegular = true; // whether time stamps are meant to lie on the rate's grid
    bool isBt709 = false;  // else BT.601: the matrix between its YUV and RGB
    bool hasAlpha = false;
    bool hasTitle = false; // of the whole file

    std::vector<std::string> AudioCodecs() const; // in order
};

// Throws CHostError with InputUnreadable.
VideoInfo ProbeVideo(const VideoTools& tools, const MediaInput& input);

} // namespace kyvhost
