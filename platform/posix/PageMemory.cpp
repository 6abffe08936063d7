// Page-allocated scratch memory on Linux.
#include "platform/PageMemory.h"

#include <limits>
#include <new>

#include <sys/mman.h>

namespace kyv {

CPageBlock::CPageBlock(size_t bytes) {
    if (bytes == 0) {
        return;
    }
    if (bytes > std::numeric_limits<size_t>::max() - kAlignment) {
        throw std::bad_alloc();
    }
    const size_t size = bytes + kAlignment;
    void* block = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (block == MAP_FAILED) {
        throw std::bad_alloc();
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
