// Streams of frames.
#include "host/Clip.h"

#include <cstring>
#include <utility>

#include "host/AyuvFrame.h"

namespace kyvhost {
namespace {

// Enough that a slow frame on one side does not stop the other.
constexpr int kFramesAhead = 4;

class CStillSource : public CFrameSource {
public:
    explicit CStillSource(Frame&& frame) : m_frame(std::move(frame)) {}

    const uint8_t* Next() override { return m_frame.data(); }

private:
    Frame m_frame;
};

class CVideoSource : public CFrameSource {
public:
    CVideoSource(std::unique_ptr<CVideoReader> reader, uint32_t width, uint32_t height,
                 const FrameForm& form)
        : m_pReader(std::move(reader)), m_nWidth(width), m_fileBytes(size_t{width} * height * 4),
          m_form(form) {
        for (int i = 0; i < kFramesAhead; ++i) {
            m_free.Push(Frame());
        }
        m_thread = std::thread([this] { ReadFrames(); });
    }

    ~CVideoSource() override {
        m_free.Close();
        m_pReader->Abort();
        Join();
    }

    const uint8_t* Next() override {
        std::optional<Frame> frame = m_filled.Pop();
        if (!frame) {
            Join();
            if (m_error) {
                std::rethrow_exception(m_error);
            }
            return nullptr;
        }
        m_current.swap(*frame);
        if (!frame->empty()) {
            m_free.Push(std::move(*frame));
        }
        return m_current.data();
    }

private:
    void ReadFrames() {
        try {
            while (std::optional<Frame> frame = m_free.Pop()) {
                frame->resize(m_fileBytes);
                if (!m_pReader->Read(frame->data())) {
                    break;
                }
                m_form.Apply(*frame, m_nWidth);
                m_filled.Push(std::move(*frame));
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
    CFrameQueue m_free, m_filled;
    Frame m_current;
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

CFrameSink::CFrameSink(std::unique_ptr<CVideoWriter> writer, size_t frameBytes, bool ayuv)
    : m_pWriter(std::move(writer)), m_frameBytes(frameBytes), m_bAyuv(ayuv) {
    for (int i = 0; i < kFramesAhead; ++i) {
        m_free.Push(Frame(m_frameBytes));
    }
    m_thread = std::thread([this] { WriteFrames(); });
}

CFrameSink::~CFrameSink() {
    if (m_thread.joinable()) {
        m_filled.Close();
        m_pWriter->Abort();
        m_thread.join();
    }
}

Frame CFrameSink::Take() {
    std::optional<Frame> frame = m_free.Pop();
    if (!frame) {
        Rethrow();
    }
    return std::move(*frame);
}

void CFrameSink::Put(Frame&& frame) {
    m_filled.Push(std::move(frame));
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
        while (std::optional<Frame> frame = m_filled.Pop()) {
            if (m_bAyuv) {
                AyuvToBgra(frame->data(), frame->size() / 4);
            }
            m_pWriter->Write(frame->data());
            m_free.Push(std::move(*frame));
        }
    } catch (...) {
        m_error = std::current_exception();
        m_free.Close();
    }
}

// The free frames end only when the writer thread has failed.
void CFrameSink::Rethrow() {
    m_thread.join();
    std::rethrow_exception(m_error);
}

} // namespace kyvhost
