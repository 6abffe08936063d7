// Threads, events and locks of the operating system.
#pragma once

#include <cstdint>

namespace kyv {

// Time-outs are in milliseconds; this one never runs out.
inline constexpr uint32_t kInfinite = 0xFFFFFFFF;

// Auto-reset: a Set lets one Wait pass, now or later; further ones before that add nothing. A
// waiter that Wait has let pass may destroy the event while Set is still returning. Starts unset.
// The constructor throws std::bad_alloc when the system has none left.
class CEvent {
public:
    CEvent();
    ~CEvent();
    CEvent(const CEvent&) = delete;
    CEvent& operator=(const CEvent&) = delete;

    void Set();

    // False when the time ran out.
    bool Wait(uint32_t timeoutMs = kInfinite);

private:
    void* m_pHandle;
};

// A lock that its owner may take again; it is free after as many Unlocks.
class CLock {
public:
    CLock();
    ~CLock();
    CLock(const CLock&) = delete;
    CLock& operator=(const CLock&) = delete;

    void Lock();
    bool TryLock();
    void Unlock();

private:
    struct State;
    State* m_pState;
};

class CAutoLock {
public:
    explicit CAutoLock(CLock& lock) : m_lock(lock) { m_lock.Lock(); }
    ~CAutoLock() { m_lock.Unlock(); }
    CAutoLock(const CAutoLock&) = delete;
    CAutoLock& operator=(const CAutoLock&) = delete;

private:
    CLock& m_lock;
};

// A thread with the system's default stack size. The object must outlive the thread.
class CThread {
public:
    using Entry = uint32_t (*)(void* argument);

    CThread() = default;
    // Gives the handles back. The thread must have ended or be about to return; a thread that was
    // never started is fine.
    ~CThread();
    CThread(const CThread&) = delete;
    CThread& operator=(const CThread&) = delete;

    // Call once. False when the system grants no further thread.
    bool Start(Entry entry, void* argument);

    // A Win32 thread priority, -15 to 15, 0 being normal. Linux knows normal and, for every
    // negative value, "batch": a process without privileges could not take back anything else.
    void SetPriority(int32_t priority);
    int32_t GetPriority() const { return m_nPriority; }

    // True when the thread has ended within the time.
    bool Wait(uint32_t timeoutMs);

    // Ends the thread wherever it is, with exit code 0, and returns when it is gone. Nothing on its
    // stack is cleaned up, and a lock that the code it ran had taken stays taken.
    //
    // What must not happen is that it dies inside the allocator or the loader, whose locks the
    // whole process needs. So the thread is stopped and looked at, over and over, and ended when it
    // is in this module's own code, which holds no such lock. It is also ended when it seems to
    // wait for something that may never come, or has kept running through other libraries for
    // kMaxLooks looks; but a thread that gets no processor looks just like one that waits, and may
    // hold those locks. Windows: after kStillLooks looks at the same place, and while it is
    // stopped, another thread must be able to take the locks; only one that keeps them for ten
    // seconds on end is ended with them. Linux: a look must have interrupted a system call that
    // waits, kStillLooks times; the C library holds no lock of the allocator in such a call.
    void Terminate();

private:
    static constexpr int kStillLooks = 20; // about a millisecond each
    static constexpr int kMaxLooks = 1000;

    struct State;
    State* m_pState = nullptr;
    int32_t m_nPriority = 0;
};

// Those that this process may use; at least 1.
uint32_t ProcessorCount();

void SleepMs(uint32_t milliseconds);

} // namespace kyv
