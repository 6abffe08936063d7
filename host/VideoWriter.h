// Frames with their times into a video, through the program ffmpeg, and with them whatever else the
// source holds and the container takes.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/VideoFormats.h"
#include "host/VideoProbe.h"

namespace kyvhost {

class CFfmpeg; // a running ffmpeg
class CPlayer;

// The sound of two clips, the second fading in where the first fades out. An empty name is silence.
struct SoundJoin {
    std::filesystem::path first, second;
    double firstSeconds = 0, secondSeconds = 0; // of the clips
    double overlapSeconds = 0;
};

// A source whose sound, subtitles, chapters, titles and so on go with the pictures.
struct CarriedSource {
    MediaInput input;
    VideoInfo info;
    double start = 0;   // seconds of it that are left out
    double seconds = 0; // of it at most; 0: all
};

// What a written video is made of.
struct VideoFormat {
    const Container* container = nullptr;
    const Codec* codec = nullptr;
    uint32_t width = 0, height = 0;
    Rational rate;
    Rational tick{1, 1000}; // seconds of the finest time stamps
    Rational sampleAspect{1, 1};
    bool isBt709 = false;
    ColorLabels labels;
    bool alpha = false;
    FieldOrder fields = FieldOrder::Progressive;
    double startSeconds = 0;              // of the pictures after the start of the source
    std::optional<CarriedSource> carried; // one or the other
    std::optional<SoundJoin> join;
    std::vector<std::string> options; // the user's, for the encoder; they come last
    std::string playerTitle;          // not empty: the video goes into a window of this name
};

// What of all that is lost or changed on the way, a sentence each.
std::vector<std::string> Losses(const VideoFormat& format);

class CVideoWriter {
public:
    // The name is "-" for standard output.
    CVideoWriter(const VideoTools& tools, const std::filesystem::path& file,
                 const VideoFormat& format);
    ~CVideoWriter();

    // Times never go back. Throws CHostError with RenderingFailed and ffmpeg's last line when
    // ffmpeg has given up, and CPlayerClosed when the window has been closed.
    void Write(const uint8_t* frame, int64_t nanoseconds);

    // Waits until the file is complete. Throws likewise.
    void Finish();

    // Makes a Write that waits come back. For another thread.
    void Abort();

private:
    [[noreturn]] void Fail();

    std::string m_argument;
    size_t m_frameBytes;
    std::unique_ptr<CFfmpeg> m_pFfmpeg;
    std::unique_ptr<CPlayer> m_pPlayer; // reads from ffmpeg
};

} // namespace kyvhost
