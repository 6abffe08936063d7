// The command line's surroundings on Linux.
#include "platform/Console.h"

#include <cerrno>
#include <csignal>
#include <thread>

#include <unistd.h>

namespace kyv {

std::vector<std::string> CommandLineArguments(int argc, char** argv) {
    return std::vector<std::string>(argv + (argc > 0 ? 1 : 0), argv + argc);
}

bool ErrorIsTerminal() {
    return isatty(STDERR_FILENO) == 1;
}

void OnInterrupt(std::function<void()> action) {
    sigset_t signals;
    sigemptyset(&signals);
    bool any = false;
    for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
        struct sigaction current = {};
        sigaction(number, nullptr, &current);
        if (current.sa_handler != SIG_IGN) { // nohup and background jobs stay undisturbed
            sigaddset(&signals, number);
            any = true;
        }
    }
    if (!any) {
        return;
    }
    // Blocked here and in every thread started later, they are all taken by the one that waits.
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    std::thread([signals, action = std::move(action)] {
        int number = 0;
        while (sigwait(&signals, &number) != 0) {
        }
        action();
    }).detach();
}

size_t ReadStandardInput(void* buffer, size_t size) {
    for (;;) {
        const ssize_t count = read(STDIN_FILENO, buffer, size);
        if (count >= 0) {
            return static_cast<size_t>(count);
        }
        if (errno != EINTR) {
            return 0;
        }
    }
}

void FailAtFileSizeLimit() {
    std::signal(SIGXFSZ, SIG_IGN);
}

} // namespace kyv
