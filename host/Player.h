// A window that shows a video while it is made: the program ffplay.
#pragma once

#include <atomic>
#include <exception>
#include <memory>
#include <string>
#include <thread>

#include "host/VideoProbe.h"
#include "platform/Process.h"

namespace kyvhost {

class CFfmpeg; // or its companion, running

// Thrown when the user has closed the window: there is nothing more to do, and nothing is wrong.
class CPlayerClosed : public std::exception {};

class CPlayer {
public:
    // Shows the NUT stream that the process puts out, which has to stay, until either ends. When
    // the window is closed the process is ended.
    CPlayer(const VideoTools& tools, const std::string& title, kyv::CProcess& from);
    ~CPlayer();

    CPlayer(const CPlayer&) = delete;
    CPlayer& operator=(const CPlayer&) = delete;

    // Waits until everything has been shown. Throws as below.
    void Finish();

    // Throws CPlayerClosed when the window has been closed, and CHostError with RenderingFailed
    // when ffplay has failed.
    void ThrowIfEnded();

private:
    void Pass();

    kyv::CProcess& m_from;
    std::unique_ptr<CFfmpeg> m_pFfplay;
    std::atomic<bool> m_bEnded = false; // before the stream did
    std::thread m_thread;
};

} // namespace kyvhost
