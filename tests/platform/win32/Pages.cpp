// Pages on Windows.
#include "tests/platform/Pages.h"

#include <windows.h>

namespace kyvtest {

size_t PageBytes() {
    SYSTEM_INFO info;
    GetSystemInfo(&info);
    return info.dwPageSize;
}

void* ReservePages(size_t bytes) {
    return VirtualAlloc(nullptr, bytes, MEM_RESERVE, PAGE_NOACCESS);
}

bool ProtectPages(void* pages, size_t bytes, bool writable) {
    return VirtualAlloc(pages, bytes, MEM_COMMIT, writable ? PAGE_READWRITE : PAGE_READONLY) !=
           nullptr;
}

void ReleasePages(void* pages, size_t) {
    VirtualFree(pages, 0, MEM_RELEASE);
}

} // namespace kyvtest
