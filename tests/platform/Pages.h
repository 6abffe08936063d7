// Pages of the system's memory and who may touch them.
#pragma once

#include <cstddef>

namespace kyvtest {

size_t PageBytes();
// Pages that nobody may touch yet; null when there are none.
void* ReservePages(size_t bytes);
// Lets them be read, and written or not.
bool ProtectPages(void* pages, size_t bytes, bool writable);
void ReleasePages(void* pages, size_t bytes);

} // namespace kyvtest
