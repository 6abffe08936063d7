// Showing videos through ffplay.
#include "host/Player.h"

#include <vector>

#include "host/ExitStatus.h"
#include "host/Ffmpeg.h"

namespace kyvhost {
namespace {

using kyv::ChildStream;

constexpr size_t kPieceBytes = 1 << 20;

} // namespace

CPlayer::CPlayer(const VideoTools& tools, const std::string& title, kyv::CProcess& from)
    : m_from(from), m_pFfplay(std::make_unique<CFfmpeg>(
                        tools.Companion("ffplay"), tools.Option(),
                        std::vector<std::string>{"-v", "error", "-autoexit", "-window_title", title,
                                                 "-f", "nut", "-i", "pipe:0"},
                        ChildStream::Pipe, ChildStream::Null, ExitStatus::RenderingFailed)),
      m_thread([this] { Pass(); }) {}

CPlayer::~CPlayer() {
    m_from.Kill(); // or the thread may wait for it
    m_pFfplay->Process().Kill();
    if (m_thread.joinable()) {
        m_thread.join();
    }
}

void CPlayer::Pass() {
    std::vector<uint8_t> piece(kPieceBytes);
    while (const size_t count = m_from.ReadOutput(piece.data(), piece.size())) {
        if (!m_pFfplay->Process().WriteInput(piece.data(), count)) {
            m_bEnded = true;
            m_from.Kill();
            return;
        }
    }
    m_pFfplay->Process().CloseInput();
}

void CPlayer::Finish() {
    m_thread.join();
    m_bEnded = true;
    try {
        ThrowIfEnded();
    } catch (const CPlayerClosed&) { // by itself, at the end
    }
}

void CPlayer::ThrowIfEnded() {
    if (!m_bEnded) {
        return;
    }
    const int status = m_pFfplay->Wait();
    if (status != 0) {
        const std::string line = m_pFfplay->LastLineAbout("pipe:0");
        throw CHostError(
            ExitStatus::RenderingFailed,
            "ffplay stopped: " +
                (line.empty() ? "it ended with status " + std::to_string(status) : line));
    }
    throw CPlayerClosed();
}

} // namespace kyvhost
