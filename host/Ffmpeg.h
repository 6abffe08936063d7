// One running ffmpeg or ffprobe: its process, what it says, and its end on interruption.
#pragma once

#include <deque>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "host/ExitStatus.h"
#include "host/InputPipe.h"
#include "host/Interrupt.h"
#include "platform/Process.h"

namespace kyvhost {

class CFfmpeg {
public:
    // Who takes lines of standard error, on a thread of its own.
    class ILineTaker {
    public:
        virtual ~ILineTaker() = default;

        // Whether the line was meant for it.
        virtual bool Take(const std::string& line) = 0;

        // No more lines come: whoever waits for one waits in vain.
        virtual void End() = 0;
    };

    // option: what the user has named the program by; empty when it is the installed one. status:
    // that of the error when the installed one cannot be started; a bad option is wrong use.
    CFfmpeg(const std::string& program, const std::string& option,
            const std::vector<std::string>& arguments, kyv::ChildStream input,
            kyv::ChildStream output, ExitStatus status,
            std::shared_ptr<ILineTaker> lineTaker = nullptr);
    ~CFfmpeg();

    kyv::CProcess& Process() { return m_process; }

    // Waits for the end and for the last words. The exit status.
    int Wait();

    // The most telling line of its standard error, without the name of the file that it is about,
    // which the user's line has already; empty when it has said nothing. After Wait.
    std::string LastLineAbout(const std::string& file) const;

    // Whether one of its last lines contains the text. After Wait.
    bool HasNamed(const std::string& text) const;

private:
    void CollectLines();

    kyv::CProcess m_process;
    std::shared_ptr<ILineTaker> m_pLineTaker;
    std::deque<std::string> m_lines; // the last few; the collector's until it has been joined
    std::thread m_collector;
    CInterruptGuard m_guard; // the first to go: an interruption must find the process alive
};

// Passes a pipe on to the standard input of a program, from a thread for which nobody waits: it may
// be reading from somebody who has stopped writing. With keep another program can read it all
// again.
void FeedFromPipe(std::shared_ptr<CFfmpeg> ffmpeg, std::shared_ptr<CInputPipe> pipe, bool keep);

} // namespace kyvhost
