// The process as Linux sees it.
#include "tests/platform/ProcessUse.h"

#include <filesystem>
#include <iterator>

#include <malloc.h>
#include <sys/resource.h>

namespace kyvtest {
namespace {

int64_t CountEntries(const char* directory) {
    return std::distance(std::filesystem::directory_iterator(directory), {});
}

} // namespace

ProcessUse GetProcessUse() {
    const auto heap = mallinfo2();
    return {CountEntries("/proc/self/task"), CountEntries("/proc/self/fd"),
            static_cast<int64_t>(heap.uordblks + heap.hblkhd), 50'000};
}

int64_t GetPageFaults() {
    rusage use = {};
    getrusage(RUSAGE_THREAD, &use);
    return use.ru_minflt + use.ru_majflt;
}

} // namespace kyvtest
