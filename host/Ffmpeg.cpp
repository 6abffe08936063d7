// A running ffmpeg.
#include "host/Ffmpeg.h"

#include <algorithm>
#include <system_error>
#include <utility>

#include "host/Hosting.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

constexpr size_t kLinesKept = 8;

// Shells the system's error: "cannot be started" is what the user has to mend.
template <class Start>
auto Started(const std::string& program, const std::string& option, ExitStatus status,
             Start&& start) {
    try {
        return start();
    } catch (const std::system_error& error) {
        if (!option.empty()) {
            throw CUsageError("--ffmpeg: " + Quoted(option) +
                              (program == option ? " cannot be started ("
                                                 : " has no " + TextOf(PathOf(program).filename()) +
                                                       " beside it (") +
                              error.code().message() + ")");
        }
        throw CHostError(status, "videos need " + program + ", which cannot be started (" +
                                     error.code().message() +
                                     "); install ffmpeg or name it with --ffmpeg FILE");
    }
}

} // namespace

CFfmpeg::CFfmpeg(const std::string& program, const std::string& option,
                 const std::vector<std::string>& arguments, kyv::ChildStream input,
                 kyv::ChildStream output, ExitStatus status, std::shared_ptr<ILineTaker> lineTaker)
    : m_process(Started(program, option, status,
                        [&] {
                            return kyv::CProcess(program, arguments, input, output,
                                                 kyv::ChildStream::Pipe);
                        })),
      m_pLineTaker(std::move(lineTaker)), m_collector([this] { CollectLines(); }), m_guard([this] {
          m_process.Kill();
          m_process.Wait();
      }) {}

CFfmpeg::~CFfmpeg() {
    m_process.Kill();
    if (m_collector.joinable()) {
        m_collector.join();
    }
}

int CFfmpeg::Wait() {
    const int status = m_process.Wait();
    if (m_collector.joinable()) {
        m_collector.join();
    }
    return status;
}

std::string CFfmpeg::LastLineAbout(const std::string& file) const {
    for (auto line = m_lines.rbegin(); line != m_lines.rend(); ++line) {
        // These follow every error and explain none.
        if (*line != "Conversion failed!" && !line->starts_with("Error initializing output")) {
            const size_t at = line->find(file + ": ");
            return at == std::string::npos ? *line : line->substr(at + file.size() + 2);
        }
    }
    return {};
}

bool CFfmpeg::HasNamed(const std::string& text) const {
    return std::any_of(m_lines.begin(), m_lines.end(), [&](const std::string& line) {
        return line.find(text) != std::string::npos;
    });
}

void CFfmpeg::CollectLines() {
    std::string line;
    char buffer[512];
    while (const size_t count = m_process.ReadError(buffer, sizeof buffer)) {
        for (const char c : std::string_view(buffer, count)) {
            if (c != '\n' && c != '\r') {
                line += c;
                continue;
            }
            if (!line.empty() && !(m_pLineTaker && m_pLineTaker->Take(line))) {
                m_lines.push_back(line);
            }
            line.clear();
            if (m_lines.size() > kLinesKept) {
                m_lines.pop_front();
            }
        }
    }
    if (!line.empty() && !(m_pLineTaker && m_pLineTaker->Take(line))) {
        m_lines.push_back(line);
    }
    if (m_pLineTaker) {
        m_pLineTaker->End();
    }
}

void FeedFromPipe(std::shared_ptr<CFfmpeg> ffmpeg, std::shared_ptr<CInputPipe> pipe, bool keep) {
    std::thread([ffmpeg = std::move(ffmpeg), pipe = std::move(pipe), keep] {
        pipe->Pass(
            [&](const void* data, size_t size) { return ffmpeg->Process().WriteInput(data, size); },
            keep);
        ffmpeg->Process().CloseInput();
    }).detach();
}

} // namespace kyvhost
