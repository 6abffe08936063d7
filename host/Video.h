// Videos through the programs ffmpeg and ffprobe: frames come and go as raw BGRA over pipes, so
// the host is tied to no version of a library.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/Rational.h"

namespace kyvhost {

// ffmpeg by the name or path the user gave; ffprobe lies beside it.
struct VideoTools {
    std::string ffmpeg = "ffmpeg";

    // The user's choice; empty for the installed one.
    std::string Option() const { return ffmpeg == "ffmpeg" ? "" : ffmpeg; }

    std::string Ffprobe() const;
};

// A file's first video stream as a player shows it, and what goes with it.
struct VideoInfo {
    int streamIndex = 0;
    uint32_t width = 0; // pixels, after the rotation that the file asks for
    uint32_t height = 0;
    Rational rate;               // frames a second; the average when the rate varies
    int64_t frameCount = 0;      // as the file says or its duration gives; 0 when unknown
    double startSeconds = 0;     // of the stream, counted from the start of the file
    Rational sampleAspect{1, 1}; // shape of a pixel
    bool isBt709 = false;        // else BT.601: the matrix between its YUV and RGB
    bool hasMatrixTag = false;
    std::vector<std::string> audioCodecs; // of every sound track, in order
};

// Throws CHostError with InputUnreadable.
VideoInfo ProbeVideo(const VideoTools& tools, const std::filesystem::path& file);

class CFfmpeg; // a running ffmpeg

// Frames of one size and rate from a file.
class CVideoReader {
public:
    // Frames are scaled to width x height and repeated or dropped to keep the given rate.
    // startSeconds leaves out what comes before.
    CVideoReader(const VideoTools& tools, const std::filesystem::path& file, const VideoInfo& info,
                 uint32_t width, uint32_t height, const Rational& rate, double startSeconds);
    ~CVideoReader();

    // False at the end. Throws CHostError with InputUnreadable when ffmpeg gives up.
    bool Read(uint8_t* frame);

    // Makes a Read that waits come back. For another thread.
    void Abort();

private:
    std::filesystem::path m_file;
    size_t m_frameBytes;
    int64_t m_nFrames = 0;
    std::unique_ptr<CFfmpeg> m_pFfmpeg;
};

enum class VideoCodec {
    H264, // 4:2:0, for watching
    Ffv1, // every byte kept, alpha included
};

// The sound of two clips, the second fading in where the first fades out. An empty name is silence.
struct SoundJoin {
    std::filesystem::path first, second;
    double firstSeconds = 0, secondSeconds = 0; // of the clips
    double overlapSeconds = 0;
};

// What a written video is made of. The sound comes from the source file, if there is one.
struct VideoFormat {
    VideoCodec codec = VideoCodec::H264;
    uint32_t width = 0;
    uint32_t height = 0;
    Rational rate;
    Rational sampleAspect{1, 1};
    bool isBt709 = false;
    std::filesystem::path soundFile; // empty: silent
    std::vector<std::string> audioCodecs;
    double startSeconds = 0;       // of the pictures after the start of the sound file
    double soundStart = 0;         // seconds of the sound file that are left out
    double soundSeconds = 0;       // of sound at most; 0: all
    std::optional<SoundJoin> join; // in place of the sound file
};

// Whether the name's extension is one that videos are written to: .mp4 .m4v .mov .mkv
bool IsVideoName(const std::filesystem::path& file);

// Throws CUsageError when the container cannot hold the codec.
void CheckContainer(const std::filesystem::path& file, VideoCodec codec);

// Of the sound tracks, those that the container does not take and that become AAC.
std::vector<std::string> RecodedAudio(const std::filesystem::path& file,
                                      const std::vector<std::string>& codecs);

class CVideoWriter {
public:
    CVideoWriter(const VideoTools& tools, const std::filesystem::path& file,
                 const VideoFormat& format);
    ~CVideoWriter();

    // Throws CHostError with RenderingFailed and ffmpeg's last line when ffmpeg has given up.
    void Write(const uint8_t* frame);

    // Waits until the file is complete. Throws likewise.
    void Finish();

    // Makes a Write that waits come back. For another thread.
    void Abort();

private:
    [[noreturn]] void Fail();

    std::filesystem::path m_file;
    size_t m_frameBytes;
    std::unique_ptr<CFfmpeg> m_pFfmpeg;
};

} // namespace kyvhost
