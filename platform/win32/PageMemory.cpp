// Page-allocated scratch memory on Windows.
#include "platform/PageMemory.h"

#include <limits>

#include <windows.h>

namespace kyv {

CPageBlock::CPageBlock(size_t bytes) {
    if (bytes == 0 || bytes > std::numeric_limits<size_t>::max() - kAlignment) {
        return;
    }
    const size_t size = bytes + kAlignment;
    void* block = VirtualAlloc(nullptr, size, MEM_RESERVE | MEM_COMMIT, PAGE_READWRITE);
    if (!block) {
        return;
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
