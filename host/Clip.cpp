// Streams of frames.
#include "host/Clip.h"

#include <cmath>
#include <cstring>
#include <utility>

#include "host/AyuvFrame.h"

namespace kyvhost {
namespace {

// Enough that a slow frame on one side does not stop the other.
constexpr size_t kFramesAhead = 3;

class CStillSource : public CFrameSource {
public:
    explicit CStillSource(Frame&& frame) : m_frame(std::make_shared<Frame>(std::move(frame))) {}

    std::optional<TimedFrame> Next() override {
        return m_frame ? std::optional(TimedFrame{std::exchange(m_frame, nullptr), 0})
                       : std::nullopt;
    }

private:
    FramePtr m_frame; // until it has been given
};

class CVideoSource : public CFrameSource {
public:
    CVideoSource(std::unique_ptr<CVideoReader> reader, uint32_t width, uint32_t height,
                 const FrameForm& form)
        : m_pReader(std::move(reader)), m_nWidth(width), m_fileBytes(size_t{width} * height * 4),
          m_form(form), m_pPool(CFramePool::Make()), m_filled(kFramesAhead) {
        m_thread = std::thread([this] { ReadFrames(); });
    }

    ~CVideoSource() override {
        m_filled.Close();
        m_pReader->Abort();
        Join();
    }

    std::optional<TimedFrame> Next() override {
        std::optional<TimedFrame> frame = m_filled.Pop();
        if (!frame) {
            Join();
            if (m_error) {
                std::rethrow_exception(m_error);
            }
        }
        return frame;
    }

private:
    void ReadFrames() {
        try {
            for (;;) {
                TimedFrame frame = {m_pPool->Take()};
                frame.pixels->resize(m_fileBytes);
                if (!m_pReader->Read(frame.pixels->data(), frame.seconds)) {
                    break;
                }
                m_form.Apply(*frame.pixels, m_nWidth);
                if (!m_filled.Push(std::move(frame))) {
                    break;
                }
            }
        } catch (...) {
            m_error = std::current_exception();
        }
        m_filled.Close();
    }

    void Join() {
        if (m_thread.joinable()) {
            m_thread.join();
        }
    }

    std::unique_ptr<CVideoReader> m_pReader;
    uint32_t m_nWidth;
    size_t m_fileBytes;
    FrameForm m_form;
    std::shared_ptr<CFramePool> m_pPool;
    CQueue<TimedFrame> m_filled;
    std::exception_ptr m_error; // the reader thread's until it has been joined
    std::thread m_thread;
};

} // namespace

void FrameForm::Apply(Frame& frame, uint32_t width) const {
    if (ayuv) {
        BgraToAyuv(frame.data(), frame.size() / 4);
    }
    if (doubled) {
        const size_t rowBytes = size_t{width} * 4;
        const size_t rows = frame.size() / rowBytes;
        frame.resize(frame.size() * 2);
        // From the last row up: a row's place is never above where it came from.
        for (size_t row = rows; row-- > 0;) {
            uint8_t* const to = frame.data() + row * 2 * rowBytes;
            std::memmove(to + rowBytes, frame.data() + row * rowBytes, rowBytes);
            std::memmove(to, to + rowBytes, rowBytes);
        }
    }
}

std::unique_ptr<CFrameSource> StillSource(const Picture& picture, const FrameForm& form) {
    Frame frame = picture.pixels;
    form.Apply(frame, picture.width);
    return std::make_unique<CStillSource>(std::move(frame));
}

std::unique_ptr<CFrameSource> VideoSource(std::unique_ptr<CVideoReader> reader, uint32_t width,
                                          uint32_t height, const FrameForm& form) {
    return std::make_unique<CVideoSource>(std::move(reader), width, height, form);
}

CFollower::CFollower(std::unique_ptr<CFrameSource> source, const Rational& rate,
                     double frameSeconds)
    : m_pSource(std::move(source)), m_rate(rate), m_fFrameSeconds(frameSeconds) {}

double CFollower::Slot(double seconds) const {
    return std::round(seconds * m_rate.Value());
}

FramePtr CFollower::At(double seconds) {
    if (!m_bStarted) {
        m_bStarted = true;
        m_current = m_pSource->Next();
        m_fFirst = m_current ? m_current->seconds : 0;
        m_next = m_current ? m_pSource->Next() : std::nullopt;
    }
    const double slot = Slot(seconds);
    while (m_next && Slot(m_next->seconds - m_fFirst) <= slot) {
        m_current = std::move(m_next);
        m_next = m_pSource->Next();
    }
    if (!m_current ||
        (!m_next && slot >= Slot(m_current->seconds - m_fFirst + m_fFrameSeconds) && slot > 0)) {
        return nullptr;
    }
    return m_current->pixels;
}

CFrameSink::CFrameSink(std::unique_ptr<CVideoWriter> writer, bool ayuv)
    : m_pWriter(std::move(writer)), m_bAyuv(ayuv), m_filled(kFramesAhead) {
    m_thread = std::thread([this] { WriteFrames(); });
}

CFrameSink::~CFrameSink() {
    if (m_thread.joinable()) {
        m_filled.Close();
        m_pWriter->Abort();
        m_thread.join();
    }
}

void CFrameSink::Put(FramePtr frame, int64_t nanoseconds) {
    if (!m_filled.Push({std::move(frame), nanoseconds})) {
        m_thread.join();
        std::rethrow_exception(m_error); // nothing else closes the queue before its end
    }
}

void CFrameSink::Finish() {
    m_filled.Close();
    m_thread.join();
    if (m_error) {
        std::rethrow_exception(m_error);
    }
    m_pWriter->Finish();
}

void CFrameSink::WriteFrames() {
    try {
        while (std::optional<Item> item = m_filled.Pop()) {
            if (m_bAyuv) {
                AyuvToBgra(item->frame->data(), item->frame->size() / 4);
            }
            m_pWriter->Write(item->frame->data(), item->nanoseconds);
        }
    } catch (...) {
        m_error = std::current_exception();
        m_filled.Close();
    }
}

} // namespace kyvhost
