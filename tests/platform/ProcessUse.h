// What this process holds of the system, for tests that look for leaks.
#pragma once

#include <chrono>
#include <cstdint>
#include <thread>

namespace kyvtest {

struct ProcessUse {
    int64_t threads;
    int64_t handles;     // open files on Linux
    int64_t memoryBytes; // given out by the allocator on Linux, committed on Windows
    int64_t noiseBytes;  // by how much that moves without any leak
};

ProcessUse GetProcessUse();

// Whether there are no more threads than that. The system may list one for a moment after it was
// waited for, which is allowed for.
inline bool ThreadsComeDownTo(int64_t count) {
    for (int i = 0; i < 1000 && GetProcessUse().threads > count; ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return GetProcessUse().threads <= count;
}

// How often this thread has been given a page of memory. 0 where the system does not tell.
int64_t GetPageFaults();

} // namespace kyvtest
