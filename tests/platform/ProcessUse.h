// What this process holds of the system, for tests that look for leaks.
#pragma once

#include <cstdint>

namespace kyvtest {

struct ProcessUse {
    int64_t threads;
    int64_t handles;     // open files on Linux
    int64_t memoryBytes; // given out by the allocator on Linux, committed on Windows
    int64_t noiseBytes;  // by how much that moves without any leak
};

ProcessUse GetProcessUse();

// How often this thread has been given a page of memory. 0 where the system does not tell.
int64_t GetPageFaults();

} // namespace kyvtest
