// Leaving in good order when the user interrupts: children end, temporary files go.
#pragma once

#include <functional>
#include <list>

namespace kyvhost {

// From now on an interruption runs the actions of all guards, the newest first, and ends the
// program with ExitStatus::Interrupted. Call this once, before starting threads.
void WatchForInterrupt();

// An action for as long as it lives. While an interruption is being handled, making and ending a
// guard blocks for good, so that nothing new is begun and no other message gets out.
class CInterruptGuard {
public:
    explicit CInterruptGuard(std::function<void()> action);
    ~CInterruptGuard();

    CInterruptGuard(const CInterruptGuard&) = delete;
    CInterruptGuard& operator=(const CInterruptGuard&) = delete;

private:
    std::list<std::function<void()>>::iterator m_place;
};

} // namespace kyvhost
