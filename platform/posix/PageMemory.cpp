// Page-allocated scratch memory on Linux.
#include "platform/PageMemory.h"

#include <limits>

#include <sys/mman.h>

namespace kyv {

CPageBlock::CPageBlock(size_t bytes) {
    if (bytes == 0 || bytes > std::numeric_limits<size_t>::max() - kAlignment) {
        return;
    }
    const size_t size = bytes + kAlignment;
    void* block = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (block == MAP_FAILED) {
        return;
    }
    m_pBlock = block;
    m_nBlockBytes = size;
}

CPageBlock::~CPageBlock() {
    if (m_pBlock) {
        munmap(m_pBlock, m_nBlockBytes);
    }
}

} // namespace kyv
