// One running ffmpeg or ffprobe: its process, what it says, and its end on interruption.
#pragma once

#include <deque>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "host/ExitStatus.h"
#include "host/Interrupt.h"
#include "platform/Process.h"

namespace kyvhost {

class CFfmpeg {
public:
    // option: what the user has named the program by; empty when it is the installed one. status:
    // that of the error when the installed one cannot be started; a bad option is wrong use.
    CFfmpeg(const std::string& program, const std::string& option,
            const std::vector<std::string>& arguments, kyv::ChildStream input,
            kyv::ChildStream output, ExitStatus status);
    ~CFfmpeg();

    kyv::CProcess& Process() { return m_process; }

    // Waits for the end and for the last words. The exit status.
    int Wait();

    // The most telling line of its standard error; empty when it has said nothing. After Wait.
    std::string LastLine() const;

    // Whether one of its last lines contains the text. After Wait.
    bool HasNamed(const std::string& text) const;

private:
    void CollectLines();

    kyv::CProcess m_process;
    std::deque<std::string> m_lines; // the last few; the collector's until it has been joined
    std::thread m_collector;
    CInterruptGuard m_guard; // the first to go: an interruption must find the process alive
};

} // namespace kyvhost
