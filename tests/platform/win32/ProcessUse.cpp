// The process as Windows sees it.
#include "tests/platform/ProcessUse.h"

#include <windows.h>

#include <psapi.h>
#include <tlhelp32.h>

namespace kyvtest {
namespace {

int64_t CountThreads() {
    const HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPTHREAD, 0);
    THREADENTRY32 entry = {};
    entry.dwSize = sizeof entry;
    int64_t count = 0;
    for (BOOL more = Thread32First(snapshot, &entry); more; more = Thread32Next(snapshot, &entry)) {
        count += entry.th32OwnerProcessID == GetCurrentProcessId();
    }
    CloseHandle(snapshot);
    return count;
}

} // namespace

ProcessUse GetProcessUse() {
    DWORD handles = 0;
    GetProcessHandleCount(GetCurrentProcess(), &handles);
    PROCESS_MEMORY_COUNTERS memory = {};
    K32GetProcessMemoryInfo(GetCurrentProcess(), &memory, sizeof memory);
    return {CountThreads(), handles, static_cast<int64_t>(memory.PagefileUsage), 4'000'000};
}

int64_t GetPageFaults() {
    return 0; // counted for the whole process only, and not at all by some systems
}

} // namespace kyvtest
