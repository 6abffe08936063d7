// How kyvhost ends, and the error that carries it there.
#pragma once

#include <stdexcept>
#include <string>

#include "host/Hosting.h"
#include "hosting/Error.h"

namespace kyvhost {

enum class ExitStatus {
    Done = 0,
    RenderingFailed = 1, // the module or the writing of the result failed
    WrongUse = 2,        // options, names and values: CUsageError
    InputUnreadable = 3, // a missing or broken picture or video
    ModuleNotUsable = 4, // not there, no library, exports missing, another format number
    Interrupted = 130,
};

// The text is the one line that the user sees. It names what was wrong and what would be right.
class CHostError : public std::runtime_error {
public:
    CHostError(ExitStatus status, const std::string& text)
        : std::runtime_error(text), m_status(status) {}

    ExitStatus Status() const { return m_status; }

private:
    ExitStatus m_status;
};

} // namespace kyvhost
