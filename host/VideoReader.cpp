// Videos in through ffmpeg.
#include "host/VideoReader.h"

#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <deque>
#include <mutex>

#include "host/ExitStatus.h"
#include "host/Ffmpeg.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

using kyv::ChildStream;

[[noreturn]] void Unreadable(const std::string& name, const std::string& why) {
    throw CHostError(ExitStatus::InputUnreadable, name + ": " + why);
}

constexpr int64_t kNoTime = INT64_MIN; // a frame without a time stamp

std::string Decimal(double number) {
    char text[64];
    std::snprintf(text, sizeof text, "%.6f", number);
    return text;
}

// Frames in the wanted size and form; each tells its time on standard error before it comes.
std::string Filters(const VideoInfo& info, const ReaderForm& form, const Rational& tick) {
    std::string filters;
    if (form.rate) {
        filters += "fps=" + TextOf(*form.rate) + ",";
    }
    filters += "scale=" + std::to_string(form.width) + ":" + std::to_string(form.height) +
               ":flags=bicubic+accurate_rnd+full_chroma_int+full_chroma_inp";
    if (info.fields != FieldOrder::Progressive) {
        filters += ":interl=1"; // the chroma of a field belongs to that field
    }
    if (info.labels.matrix.empty()) {
        filters += std::string(":in_color_matrix=") + (info.isBt709 ? "bt709" : "bt601");
    }
    return filters + ",settb=" + TextOf(tick) +
           ",metadata=mode=add:key=kyv:value=1"
           ",metadata=mode=print:key=kyv:file=pipe\\\\:2:direct=1";
}

} // namespace

// The times that come over standard error, a line a frame, ahead of the frames.
class CVideoReader::CTimes : public CFfmpeg::ILineTaker {
public:
    bool Take(const std::string& line) override {
        if (line.starts_with("kyv=")) {
            return true;
        }
        const size_t at = line.find("pts:");
        if (!line.starts_with("frame:") || at == std::string::npos) {
            return false;
        }
        const std::lock_guard lock(m_mutex);
        const char* const number = line.c_str() + at + 4;
        m_ticks.push_back(*number == 'N' ? kNoTime : std::atoll(number)); // NOPTS
        m_changed.notify_one();
        return true;
    }

    void End() override {
        const std::lock_guard lock(m_mutex);
        m_bEnded = true;
        m_changed.notify_one();
    }

    // Waits for a time. None when ffmpeg has ended without telling it.
    std::optional<int64_t> Next() {
        std::unique_lock lock(m_mutex);
        m_changed.wait(lock, [this] { return m_bEnded || !m_ticks.empty(); });
        if (m_ticks.empty()) {
            return std::nullopt;
        }
        const int64_t ticks = m_ticks.front();
        m_ticks.pop_front();
        return ticks;
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::deque<int64_t> m_ticks;
    bool m_bEnded = false;
};

CVideoReader::CVideoReader(const VideoTools& tools, const MediaInput& input, const VideoInfo& info,
                           const ReaderForm& form)
    : m_name(TextOf(input.file)), m_argument(input.Argument()),
      m_frameBytes(size_t{form.width} * form.height * 4), m_rate(form.rate.value_or(info.rate)),
      m_tick(form.rate ? Rational{form.rate->den, form.rate->num} : info.timeBase),
      m_pTimes(std::make_shared<CTimes>()) {
    std::vector<std::string> arguments = {"-v", "error"};
    const auto add = [&](const std::vector<std::string>& more) {
        arguments.insert(arguments.end(), more.begin(), more.end());
    };
    if (!input.pipe) {
        add({"-nostdin"});
    }
    if (form.startSeconds > 0) {
        add({"-ss", Decimal(form.startSeconds)});
    }
    if (info.hasAlpha && info.codec.starts_with("vp")) {
        add({"-c:v", info.codec == "vp8" ? "libvpx" : "libvpx-vp9"}); // the one that reads alpha
    }
    add(input.options);
    // The scaling also holds frames to one size when the stream changes its own.
    add({"-i", m_argument, "-map", "0:" + std::to_string(info.streamIndex), "-fps_mode",
         "passthrough", "-vf", Filters(info, form, m_tick), "-f", "rawvideo", "-pix_fmt", "bgra",
         "pipe:1"});
    m_pFfmpeg = std::make_shared<CFfmpeg>(tools.ffmpeg, tools.Option(), arguments,
                                          input.pipe ? ChildStream::Pipe : ChildStream::Null,
                                          ChildStream::Pipe, ExitStatus::InputUnreadable, m_pTimes);
    if (input.pipe) {
        FeedFromPipe(m_pFfmpeg, input.pipe, false);
    }
}

CVideoReader::~CVideoReader() {
    m_pFfmpeg->Process().Kill();
}

bool CVideoReader::Read(uint8_t* frame, double& seconds) {
    size_t have = 0;
    while (have < m_frameBytes) {
        const size_t count = m_pFfmpeg->Process().ReadOutput(frame + have, m_frameBytes - have);
        if (count == 0) {
            break;
        }
        have += count;
    }
    if (have == m_frameBytes) {
        const std::optional<int64_t> ticks = m_pTimes->Next();
        if (!ticks) {
            Unreadable(m_name,
                       "ffmpeg has not told the time of frame " + std::to_string(m_nFrames));
        }
        seconds = *ticks == kNoTime ? static_cast<double>(m_nFrames) / m_rate.Value()
                                    : static_cast<double>(*ticks) * m_tick.Value();
        ++m_nFrames;
        return true;
    }
    const int status = m_pFfmpeg->Wait();
    const std::string line = m_pFfmpeg->LastLineAbout(m_argument);
    if (status != 0 || have != 0) {
        Unreadable(m_name, "ffmpeg stopped reading after frame " + std::to_string(m_nFrames) +
                               " (" + line + ")");
    }
    if (!line.empty()) {
        std::fprintf(stderr, "kyvhost: note: %s is damaged: %s\n", m_name.c_str(), line.c_str());
    }
    return false;
}

void CVideoReader::Abort() {
    m_pFfmpeg->Process().Kill();
}

} // namespace kyvhost
