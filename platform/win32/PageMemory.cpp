// Page-allocated scratch memory on Windows.
#include "platform/PageMemory.h"

#include <limits>
#include <new>

#include <windows.h>

namespace kyv {

CPageBlock::CPageBlock(size_t bytes) {
    if (bytes == 0) {
        return;
    }
    if (bytes > std::numeric_limits<size_t>::max() - kAlignment) {
        throw std::bad_alloc();
    }
    const size_t size = bytes + kAlignment;
    void* block = VirtualAlloc(nullptr, size, MEM_RESERVE | MEM_COMMIT, PAGE_READWRITE);
    if (!block) {
        throw std::bad_alloc();
    }
    m_pBlock = block;
    m_nBlockBytes = size;
}

CPageBlock::~CPageBlock() {
    if (m_pBlock) {
        VirtualFree(m_pBlock, 0, MEM_RELEASE);
    }
}

} // namespace kyv
