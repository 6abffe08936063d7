// Child processes on Linux.
#include "platform/Process.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <mutex>
#include <system_error>

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace kyv {
namespace {

// Frames are megabytes; the usual 64 KiB would switch processes more than a hundred times for one.
constexpr int kPipeBytes = 1 << 20;

[[noreturn]] void Fail(int error, const std::string& what) {
    throw std::system_error(error, std::generic_category(), what);
}

class CDescriptor {
public:
    CDescriptor() = default;
    explicit CDescriptor(int descriptor) : m_nDescriptor(descriptor) {}
    ~CDescriptor() { Close(); }
    CDescriptor(const CDescriptor&) = delete;
    CDescriptor& operator=(CDescriptor&& other) noexcept {
        std::swap(m_nDescriptor, other.m_nDescriptor);
        return *this;
    }

    int Get() const { return m_nDescriptor; }
    void Close() {
        if (m_nDescriptor >= 0) {
            close(m_nDescriptor);
            m_nDescriptor = -1;
        }
    }

private:
    int m_nDescriptor = -1;
};

// The attributes and file actions of one start, with the settings that every child gets.
class CSpawnPlan {
public:
    CSpawnPlan() {
        posix_spawn_file_actions_init(&m_actions);
        posix_spawnattr_init(&m_attributes);
        sigset_t none, all;
        sigemptyset(&none);
        sigfillset(&all);
        sigdelset(&all, SIGXFSZ); // as it is with us: see FailAtFileSizeLimit
        posix_spawnattr_setsigmask(&m_attributes, &none);
        posix_spawnattr_setsigdefault(&m_attributes, &all);
        posix_spawnattr_setpgroup(&m_attributes, 0);
        posix_spawnattr_setflags(&m_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF |
                                                    POSIX_SPAWN_SETPGROUP);
    }
    ~CSpawnPlan() {
        posix_spawn_file_actions_destroy(&m_actions);
        posix_spawnattr_destroy(&m_attributes);
    }
    CSpawnPlan(const CSpawnPlan&) = delete;
    CSpawnPlan& operator=(const CSpawnPlan&) = delete;

    // Connects a standard stream of the child; ours receives our end of a pipe, theirs keeps the
    // child's end open until the start.
    void Connect(ChildStream kind, int stream, CDescriptor& ours, CDescriptor& theirs) {
        if (kind == ChildStream::Own) {
            return;
        }
        if (kind == ChildStream::Null) {
            posix_spawn_file_actions_addopen(&m_actions, stream, "/dev/null",
                                             stream == STDIN_FILENO ? O_RDONLY : O_WRONLY, 0);
            return;
        }
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0) {
            Fail(errno, "pipe");
        }
        fcntl(ends[0], F_SETPIPE_SZ, kPipeBytes); // a wish: a refusal leaves the usual size
        const int childEnd = stream == STDIN_FILENO ? 0 : 1;
        ours = CDescriptor(ends[1 - childEnd]);
        fcntl(ours.Get(), F_SETFL, O_NONBLOCK);
        theirs = CDescriptor(ends[childEnd]);
        posix_spawn_file_actions_adddup2(&m_actions, theirs.Get(), stream);
    }

    pid_t Start(const char* program, char* const* arguments) {
        pid_t child = 0;
        const int error =
            posix_spawnp(&child, program, &m_actions, &m_attributes, arguments, environ);
        if (error != 0) {
            Fail(error, program);
        }
        return child;
    }

private:
    posix_spawn_file_actions_t m_actions;
    posix_spawnattr_t m_attributes;
};

} // namespace

struct CProcess::State {
    pid_t child = 0;
    CDescriptor input, output, error;
    CDescriptor lives;
    std::mutex mutex; // guards ended: a process number that has been waited for may be reused
    bool ended = false;
    int exitStatus = 0;

    // Waits until the stream can go on or the child has ended, and says whether it has.
    bool WaitForStreamOrEnd(const CDescriptor& stream, short event) const {
        pollfd either[] = {{stream.Get(), event, 0}, {lives.Get(), POLLIN, 0}};
        return poll(either, 2, -1) > 0 && either[1].revents != 0;
    }

    size_t Read(const CDescriptor& from, void* buffer, size_t size) const {
        for (bool childEnded = false;;) {
            const ssize_t count = read(from.Get(), buffer, size);
            if (count >= 0) {
                return static_cast<size_t>(count);
            }
            if (errno == EAGAIN && !childEnded) {
                childEnded = WaitForStreamOrEnd(from, POLLIN);
            } else if (errno != EINTR) {
                return 0;
            }
        }
    }
};

std::filesystem::path ExecutableFile() {
    std::error_code error;
    return std::filesystem::read_symlink("/proc/self/exe", error);
}

CProcess::CProcess(const std::string& program, const std::vector<std::string>& arguments,
                   ChildStream input, ChildStream output, ChildStream error)
    : m_pState(std::make_unique<State>()) {
    // A child that no longer reads is reported by WriteInput rather than by a deadly signal.
    static std::once_flag once;
    std::call_once(once, [] { std::signal(SIGPIPE, SIG_IGN); });

    CSpawnPlan plan;
    CDescriptor childInput, childOutput, childError;
    plan.Connect(input, STDIN_FILENO, m_pState->input, childInput);
    plan.Connect(output, STDOUT_FILENO, m_pState->output, childOutput);
    plan.Connect(error, STDERR_FILENO, m_pState->error, childError);

    std::vector<char*> list = {const_cast<char*>(program.c_str())};
    for (const std::string& argument : arguments) {
        list.push_back(const_cast<char*>(argument.c_str()));
    }
    list.push_back(nullptr);
    m_pState->child = plan.Start(program.c_str(), list.data());
    // Without it, on an old kernel, the streams last as long as anybody holds them.
    m_pState->lives = CDescriptor(static_cast<int>(syscall(SYS_pidfd_open, m_pState->child, 0)));
}

CProcess::~CProcess() {
    Kill();
    Wait();
}

size_t CProcess::ReadOutput(void* buffer, size_t size) {
    return m_pState->Read(m_pState->output, buffer, size);
}

size_t CProcess::ReadError(void* buffer, size_t size) {
    return m_pState->Read(m_pState->error, buffer, size);
}

bool CProcess::WriteInput(const void* data, size_t size) {
    const char* next = static_cast<const char*>(data);
    bool childEnded = false;
    while (size > 0 && !childEnded) {
        const ssize_t count = write(m_pState->input.Get(), next, size);
        if (count >= 0) {
            next += count;
            size -= static_cast<size_t>(count);
        } else if (errno == EAGAIN) {
            childEnded = m_pState->WaitForStreamOrEnd(m_pState->input, POLLOUT);
        } else if (errno != EINTR) {
            return false;
        }
    }
    return size == 0;
}

void CProcess::CloseInput() {
    m_pState->input.Close();
}

void CProcess::Kill() {
    const std::lock_guard lock(m_pState->mutex);
    if (!m_pState->ended) {
        kill(m_pState->child, SIGKILL);
    }
}

int CProcess::Wait() {
    // First wait without taking the number back, so that Kill is not held up meanwhile.
    siginfo_t info;
    {
        const std::lock_guard lock(m_pState->mutex);
        if (m_pState->ended) {
            return m_pState->exitStatus;
        }
    }
    while (waitid(P_PID, static_cast<id_t>(m_pState->child), &info, WEXITED | WNOWAIT) != 0 &&
           errno == EINTR) {
    }
    const std::lock_guard lock(m_pState->mutex);
    if (!m_pState->ended) {
        int status = 0;
        waitpid(m_pState->child, &status, 0);
        m_pState->ended = true;
        m_pState->exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + (status & 0x7f);
    }
    return m_pState->exitStatus;
}

} // namespace kyv
