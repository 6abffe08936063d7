// Threads, events and locks on Windows.
#include "platform/Threads.h"

#include <cstdlib>
#include <new>

#include <windows.h>

#include "platform/FloatEnvironment.h"

// The start of this module's image in memory. The linker chose the name.
extern "C" IMAGE_DOS_HEADER __ImageBase; // NOLINT(bugprone-reserved-identifier)

namespace kyv {

static_assert(kInfinite == INFINITE);

CEvent::CEvent() : m_pHandle(CreateEventW(nullptr, FALSE, FALSE, nullptr)) {
    if (!m_pHandle) {
        throw std::bad_alloc();
    }
}

CEvent::~CEvent() {
    CloseHandle(m_pHandle);
}

void CEvent::Set() {
    SetEvent(m_pHandle);
}

bool CEvent::Wait(uint32_t timeoutMs) {
    return WaitForSingleObject(m_pHandle, timeoutMs) == WAIT_OBJECT_0;
}

struct CLock::State {
    CRITICAL_SECTION section;
};

CLock::CLock() : m_pState(new State) {
    InitializeCriticalSection(&m_pState->section);
}

CLock::~CLock() {
    DeleteCriticalSection(&m_pState->section);
    delete m_pState;
}

void CLock::Lock() {
    EnterCriticalSection(&m_pState->section);
}

bool CLock::TryLock() {
    return TryEnterCriticalSection(&m_pState->section) != FALSE;
}

void CLock::Unlock() {
    LeaveCriticalSection(&m_pState->section);
}

struct CThread::State {
    HANDLE handle;
    Entry entry;
    void* argument;

    static DWORD WINAPI Main(LPVOID state) {
        const auto* self = static_cast<const State*>(state);
        const CFloatEnvironment environment;
        return self->entry(self->argument);
    }

    static bool IsOwnCode(DWORD64 address) {
        // In integers: to the compiler the object is its 64 bytes and not the image.
        const auto base = reinterpret_cast<DWORD64>(&__ImageBase);
        // NOLINTNEXTLINE(performance-no-int-to-ptr)
        const auto* headers = reinterpret_cast<const IMAGE_NT_HEADERS*>(
            base + static_cast<DWORD64>(__ImageBase.e_lfanew));
        return address - base < headers->OptionalHeader.SizeOfImage;
    }
};

namespace {

constexpr int kMaxTrials = 10; // failed ones, a second each, until the thread is ended all the same

// Whether the locks that every thread needs are free at this moment. A thread begins and ends under
// the loader's lock and takes the allocators' in between, so one that has ended has had them all.
class CLockTrial {
public:
    // Nothing happens before Passes. Without a thread to be had, or without need, it passes.
    explicit CLockTrial(bool needed)
        : m_thread(needed ? CreateThread(nullptr, 0, TakeLocks, nullptr, CREATE_SUSPENDED, nullptr)
                          : nullptr) {}

    // Waits for the end of the trial as long as the locks are taken, though not for ever.
    ~CLockTrial() {
        if (m_thread) {
            ResumeThread(m_thread);
            WaitForSingleObject(m_thread, kPatienceMs);
            CloseHandle(m_thread);
        }
    }
    CLockTrial(const CLockTrial&) = delete;
    CLockTrial& operator=(const CLockTrial&) = delete;

    bool Passes() const {
        if (!m_thread) {
            return true;
        }
        ResumeThread(m_thread);
        return WaitForSingleObject(m_thread, kTrialMs) == WAIT_OBJECT_0;
    }

private:
    static constexpr DWORD kTrialMs = 50;
    static constexpr DWORD kPatienceMs = 1000;
    static constexpr size_t kBlockBytes = 100000; // no small one, which may be had without a lock

    static DWORD WINAPI TakeLocks(LPVOID) {
        const HANDLE heap = GetProcessHeap();
        HeapLock(heap);
        HeapUnlock(heap);
        void* volatile block = std::malloc(kBlockBytes); // perhaps from a heap of the runtime's own
        std::free(block);
        return 0;
    }

    const HANDLE m_thread;
};

} // namespace

CThread::~CThread() {
    if (m_pState) {
        WaitForSingleObject(m_pState->handle, INFINITE);
        CloseHandle(m_pState->handle);
        delete m_pState;
    }
}

bool CThread::Start(Entry entry, void* argument) {
    auto* state = new State{nullptr, entry, argument};
    state->handle = CreateThread(nullptr, 0, State::Main, state, CREATE_SUSPENDED, nullptr);
    if (!state->handle) {
        delete state;
        return false;
    }
    m_pState = state;
    ResumeThread(state->handle);
    return true;
}

void CThread::SetPriority(int32_t priority) {
    m_nPriority = priority;
    SetThreadPriority(m_pState->handle, priority);
}

bool CThread::Wait(uint32_t timeoutMs) {
    return WaitForSingleObject(m_pState->handle, timeoutMs) == WAIT_OBJECT_0;
}

void CThread::Terminate() {
    const HANDLE handle = m_pState->handle;
    DWORD64 lastPlace = 0;
    DWORD64 lastStack = 0;
    int still = 0;
    for (int look = 0;; ++look) {
        if (Wait(look == 0 ? 0 : 1)) {
            return;
        }
        // Created before the thread is stopped, because that may need a lock which the thread has.
        const bool due = still >= kStillLooks || look >= kMaxLooks;
        CLockTrial trial(due);
        SuspendThread(handle);
        CONTEXT context = {};
        context.ContextFlags = CONTEXT_CONTROL;
        if (GetThreadContext(handle, &context)) { // waits until the thread has stopped
            if (State::IsOwnCode(context.Rip) ||
                (due && (trial.Passes() || look >= kMaxLooks + kMaxTrials))) {
                TerminateThread(handle, 0);
            }
            still = context.Rip == lastPlace && context.Rsp == lastStack ? still + 1 : 0;
            lastPlace = context.Rip;
            lastStack = context.Rsp;
        }
        ResumeThread(handle);
    }
}

uint32_t ProcessorCount() {
    SYSTEM_INFO info;
    GetSystemInfo(&info);
    return info.dwNumberOfProcessors > 0 ? info.dwNumberOfProcessors : 1;
}

void SleepMs(uint32_t milliseconds) {
    Sleep(milliseconds);
}

} // namespace kyv
