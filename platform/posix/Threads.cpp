// Threads, events and locks on Linux.
#include "platform/Threads.h"

#include <atomic>
#include <cerrno>
#include <csetjmp>
#include <cstring>
#include <mutex>
#include <new>

#include <link.h>
#include <pthread.h>
#include <sched.h>
#include <semaphore.h>
#include <signal.h>
#include <time.h>
#include <ucontext.h>
#include <unistd.h>

#include "platform/FloatEnvironment.h"

namespace kyv {
namespace {

timespec Deadline(uint32_t milliseconds) {
    timespec time;
    clock_gettime(CLOCK_MONOTONIC, &time);
    time.tv_sec += milliseconds / 1000;
    time.tv_nsec += static_cast<long>(milliseconds % 1000) * 1000000;
    if (time.tv_nsec >= 1000000000) {
        ++time.tv_sec;
        time.tv_nsec -= 1000000000;
    }
    return time;
}

// A semaphore that never counts beyond 1. Unlike a condition variable it is not harmed by a waiter
// that is terminated, and its post is the setter's last access to it.
struct Event {
    std::atomic<bool> set = false;
    sem_t semaphore;
};

// Where this module's own code lies.
struct CodeRange {
    uintptr_t begin = 0;
    uintptr_t end = 0;

    bool Contains(uintptr_t address) const { return address >= begin && address < end; }
};

int FindOwnCode(dl_phdr_info* info, size_t, void* result) {
    const auto self = reinterpret_cast<uintptr_t>(&FindOwnCode);
    for (int i = 0; i < info->dlpi_phnum; ++i) {
        const ElfW(Phdr)& segment = info->dlpi_phdr[i];
        const uintptr_t begin = info->dlpi_addr + segment.p_vaddr;
        const CodeRange range = {begin, begin + segment.p_memsz};
        if (segment.p_type == PT_LOAD && (segment.p_flags & PF_X) && range.Contains(self)) {
            *static_cast<CodeRange*>(result) = range;
            return 1;
        }
    }
    return 0;
}

const CodeRange& OwnCode() {
    static const CodeRange range = [] {
        CodeRange found;
        dl_iterate_phdr(FindOwnCode, &found);
        return found;
    }();
    return range;
}

// Where a thread that was stopped by a signal runs, and where its stack ends.
#ifdef __aarch64__
uintptr_t Place(const mcontext_t& machine) {
    return machine.pc;
}
uintptr_t Stack(const mcontext_t& machine) {
    return machine.sp;
}
int64_t Result(const mcontext_t& machine) {
    return static_cast<int64_t>(machine.regs[0]);
}
constexpr uint8_t kSystemCall[] = {0x01, 0x00, 0x00, 0xD4}; // svc #0
#else
uintptr_t Place(const mcontext_t& machine) {
    return static_cast<uintptr_t>(machine.gregs[REG_RIP]);
}
uintptr_t Stack(const mcontext_t& machine) {
    return static_cast<uintptr_t>(machine.gregs[REG_RSP]);
}
int64_t Result(const mcontext_t& machine) {
    return machine.gregs[REG_RAX];
}
constexpr uint8_t kSystemCall[] = {0x0F, 0x05}; // syscall
#endif

// Whether the signal came in the middle of a system call that waits: it has returned EINTR just
// now. One that does not, such as those of the allocator, ends before the signal is delivered, and
// with another result.
bool HasInterruptedWait(const mcontext_t& machine) {
    const uintptr_t place = Place(machine);
    const uint8_t* next;
    std::memcpy(&next, &place, sizeof next);
    return Result(machine) == -EINTR &&
           std::memcmp(next - sizeof kSystemCall, kSystemCall, sizeof kSystemCall) == 0;
}

// True when the signal reaches a thread. An emulator keeps some for itself, which the process may
// claim but not send; one is sent to this thread, which blocks it meanwhile and takes it back.
bool CanBeSent(int number) {
    sigset_t only, previous;
    sigemptyset(&only);
    sigaddset(&only, number);
    pthread_sigmask(SIG_BLOCK, &only, &previous);
    const timespec atOnce = {};
    const bool sent = pthread_sigqueue(pthread_self(), number, {}) == 0 &&
                      sigtimedwait(&only, nullptr, &atOnce) == number;
    pthread_sigmask(SIG_SETMASK, &previous, nullptr);
    return sent;
}

// The signal that stops a thread to be terminated: the highest that nobody has claimed.
int StopSignal() {
    static const int chosen = [] {
        for (int number = SIGRTMAX; number > SIGRTMIN; --number) {
            struct sigaction action;
            if (sigaction(number, nullptr, &action) == 0 && !(action.sa_flags & SA_SIGINFO) &&
                action.sa_handler == SIG_DFL && CanBeSent(number)) {
                return number;
            }
        }
        return SIGRTMAX;
    }();
    return chosen;
}

// A host's signals are none of our threads' business; faults stay theirs, and profilers see them.
void MaskSignals() {
    sigset_t blocked;
    sigfillset(&blocked);
    for (const int number :
         {StopSignal(), SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP, SIGABRT, SIGPROF}) {
        sigdelset(&blocked, number);
    }
    pthread_sigmask(SIG_SETMASK, &blocked, nullptr);
}

} // namespace

CEvent::CEvent() {
    auto* event = new Event;
    sem_init(&event->semaphore, 0, 0);
    m_pHandle = event;
}

CEvent::~CEvent() {
    auto* event = static_cast<Event*>(m_pHandle);
    sem_destroy(&event->semaphore);
    delete event;
}

// Called from the signal handler too: nothing here may take a lock.
void CEvent::Set() {
    auto* event = static_cast<Event*>(m_pHandle);
    if (!event->set.exchange(true)) {
        sem_post(&event->semaphore);
    }
}

bool CEvent::Wait(uint32_t timeoutMs) {
    auto* event = static_cast<Event*>(m_pHandle);
    if (timeoutMs == kInfinite) {
        while (sem_wait(&event->semaphore) != 0) { // interrupted
        }
    } else {
        const timespec deadline = Deadline(timeoutMs);
        while (sem_clockwait(&event->semaphore, CLOCK_MONOTONIC, &deadline) != 0) {
            if (errno != EINTR) {
                return false;
            }
        }
    }
    event->set.exchange(false);
    return true;
}

struct CLock::State {
    std::recursive_mutex mutex;
};

CLock::CLock() : m_pState(new State) {}

CLock::~CLock() {
    delete m_pState;
}

void CLock::Lock() {
    m_pState->mutex.lock();
}

bool CLock::TryLock() {
    return m_pState->mutex.try_lock();
}

void CLock::Unlock() {
    m_pState->mutex.unlock();
}

// A thread is terminated by a signal whose handler jumps back into the thread's first function,
// from where it returns in good order: the system takes back the stack and the allocator its
// cache. Cancelling it would unwind, which from an arbitrary instruction ends in std::terminate.
struct CThread::State {
    State(Entry threadEntry, void* threadArgument) : entry(threadEntry), argument(threadArgument) {}

    pthread_t thread = {};
    const Entry entry;
    void* const argument;
    CEvent ended;
    bool endSeen = false; // by Wait: the event resets itself
    bool joined = false;

    // For Terminate. The handler answers every signal by setting looked, unless it jumps.
    sigjmp_buf leave;
    std::atomic<bool> inside = false; // entry runs, so leave may be taken
    std::atomic<bool> endWaiting = false;
    std::atomic<bool> endAnywhere = false;
    const CodeRange ownCode = OwnCode();
    CEvent looked;
    std::atomic<uintptr_t> place = 0;
    std::atomic<uintptr_t> stack = 0;
    std::atomic<bool> waits = false;

    static void* Main(void* argument) {
        auto* self = static_cast<State*>(argument);
        MaskSignals();
        const CFloatEnvironment environment; // not the one that it was started in
        if (sigsetjmp(self->leave, 1) == 0) {
            self->inside = true;
            self->entry(self->argument);
        }
        self->inside = false;
        self->ended.Set();
        return nullptr;
    }

    static void OnStopSignal(int, siginfo_t* info, void* context) {
        if (info->si_code != SI_QUEUE || info->si_pid != getpid()) {
            return;
        }
        const int savedErrno = errno;
        auto* self = static_cast<State*>(info->si_value.sival_ptr);
        const mcontext_t& machine = static_cast<ucontext_t*>(context)->uc_mcontext;
        const bool waits = HasInterruptedWait(machine);
        if (self->inside && (self->ownCode.Contains(Place(machine)) ||
                             (waits && self->endWaiting) || self->endAnywhere)) {
            self->inside = false;
            siglongjmp(self->leave, 1);
        }
        self->place = Place(machine);
        self->stack = Stack(machine);
        self->waits = waits;
        self->looked.Set();
        errno = savedErrno;
    }
};

CThread::~CThread() {
    if (m_pState) {
        if (!m_pState->joined) {
            pthread_join(m_pState->thread, nullptr);
        }
        delete m_pState;
    }
}

bool CThread::Start(Entry entry, void* argument) {
    auto* state = new State(entry, argument);
    if (pthread_create(&state->thread, nullptr, State::Main, state) != 0) {
        delete state;
        return false;
    }
    m_pState = state;
    return true;
}

void CThread::SetPriority(int32_t priority) {
    if (priority != m_nPriority) {
        m_nPriority = priority;
        const sched_param none = {};
        pthread_setschedparam(m_pState->thread, priority < 0 ? SCHED_BATCH : SCHED_OTHER, &none);
    }
}

bool CThread::Wait(uint32_t timeoutMs) {
    if (!m_pState->endSeen) {
        m_pState->endSeen = m_pState->ended.Wait(timeoutMs);
    }
    return m_pState->endSeen;
}

void CThread::Terminate() {
    // The handler is there only for the time of a termination, of which there is one at a time.
    static std::mutex one;
    const std::lock_guard guard(one);
    struct sigaction action = {};
    struct sigaction previous;
    action.sa_sigaction = State::OnStopSignal;
    action.sa_flags = SA_SIGINFO; // and no SA_RESTART, which would hide what was interrupted
    sigfillset(&action.sa_mask);
    sigaction(StopSignal(), &action, &previous);

    sigval self;
    self.sival_ptr = m_pState;
    uintptr_t lastPlace = 0;
    uintptr_t lastStack = 0;
    int still = 0;
    bool asked = false;
    for (int look = 0; !Wait(look == 0 ? 0 : 1); ++look) {
        // One signal at a time: none may be left when the handler is taken away.
        if (!asked) {
            asked = pthread_sigqueue(m_pState->thread, StopSignal(), self) == 0;
        }
        if (!asked || !m_pState->looked.Wait(1)) {
            continue;
        }
        asked = false;
        const uintptr_t place = m_pState->place;
        const uintptr_t stack = m_pState->stack;
        const bool sameWait = m_pState->waits && place == lastPlace && stack == lastStack;
        still = sameWait ? still + 1 : 0;
        lastPlace = place;
        lastStack = stack;
        m_pState->endWaiting = still >= kStillLooks;
        m_pState->endAnywhere = look >= kMaxLooks;
    }
    // A signal that came while the thread was leaving dies with the thread.
    pthread_join(m_pState->thread, nullptr);
    m_pState->joined = true;
    sigaction(StopSignal(), &previous, nullptr);
}

uint32_t ProcessorCount() {
    cpu_set_t usable;
    if (sched_getaffinity(0, sizeof usable, &usable) == 0) {
        return static_cast<uint32_t>(CPU_COUNT(&usable));
    }
    const long online = sysconf(_SC_NPROCESSORS_ONLN);
    return online > 0 ? static_cast<uint32_t>(online) : 1;
}

void SleepMs(uint32_t milliseconds) {
    const timespec deadline = Deadline(milliseconds);
    while (clock_nanosleep(CLOCK_MONOTONIC, TIMER_ABSTIME, &deadline, nullptr) == EINTR) {
    }
}

} // namespace kyv
