// Clips as streams of frames: reading ahead and writing behind the effect, each on a thread of its
// own, with the frame's layout and format made on the way.
#pragma once

#include <exception>
#include <memory>
#include <thread>

#include "host/ClipInstance.h"
#include "host/FrameQueue.h"
#include "host/Picture.h"
#include "host/Video.h"

namespace kyvhost {

// How the frames of the effect come from those of the file.
struct FrameForm {
    bool ayuv = false;    // AYUV instead of BGRA
    bool doubled = false; // the same picture for both views, side by side

    // From the file's form, BGRA in rows of width pixels.
    void Apply(Frame& frame, uint32_t width) const;
};

// What an input shows, frame after frame.
class CFrameSource {
public:
    virtual ~CFrameSource() = default;

    // Null at the end. The frame stays valid until the next one is given. Throws CHostError.
    virtual const uint8_t* Next() = 0;
};

// A picture shows the same for ever. It has the size of a frame of the file's form.
std::unique_ptr<CFrameSource> StillSource(const Picture& picture, const FrameForm& form);

// width is that of the reader's frames, height their rows.
std::unique_ptr<CFrameSource> VideoSource(std::unique_ptr<CVideoReader> reader, uint32_t width,
                                          uint32_t height, const FrameForm& form);

// The video that comes out.
class CFrameSink {
public:
    CFrameSink(std::unique_ptr<CVideoWriter> writer, size_t frameBytes, bool ayuv);
    ~CFrameSink(); // gives up, unless finished

    CFrameSink(const CFrameSink&) = delete;
    CFrameSink& operator=(const CFrameSink&) = delete;

    // A frame to fill, of unknown content. Throws what stopped the writing.
    Frame Take();

    // A frame in the effect's form; it is turned back and written.
    void Put(Frame&& frame);

    // Waits until everything is written.
    void Finish();

private:
    void WriteFrames();
    void Rethrow();

    std::unique_ptr<CVideoWriter> m_pWriter;
    size_t m_frameBytes;
    bool m_bAyuv;
    CFrameQueue m_free, m_filled;
    std::exception_ptr m_error; // the writer thread's until it has been joined
    std::thread m_thread;
};

} // namespace kyvhost
