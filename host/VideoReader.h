// Frames of a video, with their times, from the program ffmpeg: raw BGRA over a pipe, so the host
// is tied to no version of a library.
#pragma once

#include <cstdint>
#include <memory>

#include "host/VideoProbe.h"

namespace kyvhost {

class CFfmpeg; // a running ffmpeg

// How the frames of a file are wanted.
struct ReaderForm {
    uint32_t width = 0, height = 0;
    double startSeconds = 0;      // leaves out what comes before
    std::optional<Rational> rate; // frames are repeated or dropped to keep it; else all as they are
};

// Frames of one size.
class CVideoReader {
public:
    CVideoReader(const VideoTools& tools, const MediaInput& input, const VideoInfo& info,
                 const ReaderForm& form);
    ~CVideoReader();

    // False at the end. seconds: when the frame is shown, counted from the start that was asked
    // for. Throws CHostError with InputUnreadable when ffmpeg gives up.
    bool Read(uint8_t* frame, double& seconds);

    // Makes a Read that waits come back. For another thread.
    void Abort();

private:
    class CTimes;

    std::string m_name, m_argument;
    size_t m_frameBytes;
    int64_t m_nFrames = 0;
    Rational m_rate;
    Rational m_tick; // seconds of a time stamp's unit
    std::shared_ptr<CTimes> m_pTimes;
    std::shared_ptr<CFfmpeg> m_pFfmpeg; // shared with the thread that feeds a pipe
};

} // namespace kyvhost
