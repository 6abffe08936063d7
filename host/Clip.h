// Clips as streams of frames: reading ahead and writing behind the effect, each on a thread of its
// own, with the frame's layout and format made on the way.
#pragma once

#include <exception>
#include <memory>
#include <optional>
#include <thread>

#include "host/ClipInstance.h"
#include "host/FrameQueue.h"
#include "host/Picture.h"
#include "host/VideoReader.h"
#include "host/VideoWriter.h"

namespace kyvhost {

// How the frames of the effect come from those of the file.
struct FrameForm {
    bool ayuv = false;    // AYUV instead of BGRA
    bool doubled = false; // the same picture for both views, side by side

    // From the file's form, BGRA in rows of width pixels.
    void Apply(Frame& frame, uint32_t width) const;
};

// A frame and when it is shown, in seconds of its file.
struct TimedFrame {
    FramePtr pixels;
    double seconds = 0;
};

// What an input shows, frame after frame.
class CFrameSource {
public:
    virtual ~CFrameSource() = default;

    // None at the end. Throws CHostError.
    virtual std::optional<TimedFrame> Next() = 0;
};

// A picture is one frame, and then the end: whoever follows it lets that frame stay for ever. It
// has the size of a frame of the file's form.
std::unique_ptr<CFrameSource> StillSource(const Picture& picture, const FrameForm& form);

// width is that of the reader's frames, height their rows.
std::unique_ptr<CFrameSource> VideoSource(std::unique_ptr<CVideoReader> reader, uint32_t width,
                                          uint32_t height, const FrameForm& form);

// A source that follows the frames of another one: at each of their times it shows the frame that
// is the nearest on the grid of the rate, and ends where its last frame has been shown.
class CFollower {
public:
    // seconds of one of the source's own frames: how long the last one stays; infinite for a
    // picture.
    CFollower(std::unique_ptr<CFrameSource> source, const Rational& rate, double frameSeconds);

    // Null at the end. Times are counted from the first frame and never go back.
    FramePtr At(double seconds);

private:
    double Slot(double seconds) const; // whole, or infinite

    std::unique_ptr<CFrameSource> m_pSource;
    Rational m_rate;
    double m_fFrameSeconds;
    double m_fFirst = 0; // its first frame's time
    std::optional<TimedFrame> m_current, m_next;
    bool m_bStarted = false;
};

// The video that comes out.
class CFrameSink {
public:
    CFrameSink(std::unique_ptr<CVideoWriter> writer, bool ayuv);
    ~CFrameSink(); // gives up, unless finished

    CFrameSink(const CFrameSink&) = delete;
    CFrameSink& operator=(const CFrameSink&) = delete;

    // A frame in the effect's form, which is turned back and written. Throws what stopped the
    // writing.
    void Put(FramePtr frame, int64_t nanoseconds);

    // Waits until everything is written.
    void Finish();

private:
    struct Item {
        FramePtr frame;
        int64_t nanoseconds;
    };

    void WriteFrames();

    std::unique_ptr<CVideoWriter> m_pWriter;
    bool m_bAyuv;
    CQueue<Item> m_filled;
    std::exception_ptr m_error; // the writer thread's until it has been joined
    std::thread m_thread;
};

} // namespace kyvhost
