// Pages on Linux.
#include "tests/platform/Pages.h"

#include <sys/mman.h>
#include <unistd.h>

namespace kyvtest {

size_t PageBytes() {
    return static_cast<size_t>(sysconf(_SC_PAGESIZE));
}

void* ReservePages(size_t bytes) {
    void* pages = mmap(nullptr, bytes, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    return pages == MAP_FAILED ? nullptr : pages;
}

bool ProtectPages(void* pages, size_t bytes, bool writable) {
    return mprotect(pages, bytes, writable ? PROT_READ | PROT_WRITE : PROT_READ) == 0;
}

void ReleasePages(void* pages, size_t bytes) {
    munmap(pages, bytes);
}

} // namespace kyvtest
