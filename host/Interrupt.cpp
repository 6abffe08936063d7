// Interruption.
#include "host/Interrupt.h"

#include <cstdio>
#include <cstdlib>
#include <mutex>

#include "host/ExitStatus.h"
#include "host/Progress.h"
#include "platform/Console.h"

namespace kyvhost {
namespace {

// Never destroyed: an interruption may come while the program is ending.
std::mutex& g_mutex = *new std::mutex;
std::list<std::function<void()>>& g_actions = *new std::list<std::function<void()>>;

void Leave() {
    g_mutex.lock(); // and never unlocked
    for (auto action = g_actions.rbegin(); action != g_actions.rend(); ++action) {
        (*action)();
    }
    CProgress::CloseLine();
    std::fputs("kyvhost: interrupted\n", stderr);
    std::_Exit(static_cast<int>(ExitStatus::Interrupted));
}

} // namespace

void WatchForInterrupt() {
    kyv::OnInterrupt(Leave);
}

CInterruptGuard::CInterruptGuard(std::function<void()> action) {
    const std::lock_guard lock(g_mutex);
    m_place = g_actions.insert(g_actions.end(), std::move(action));
}

CInterruptGuard::~CInterruptGuard() {
    const std::lock_guard lock(g_mutex);
    g_actions.erase(m_place);
}

} // namespace kyvhost
