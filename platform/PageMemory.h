// Scratch memory of the heavy operations, straight from the system's page allocator.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kyv {

// A block of zeroed, readable and writable memory, given back by the destructor.
class CPageBlock {
public:
    // The working pointer is a multiple of this.
    static constexpr size_t kAlignment = 32;

    // Takes bytes plus the slack for the alignment; 0 bytes leave an empty block. Throws
    // std::bad_alloc when the system refuses.
    explicit CPageBlock(size_t bytes);
    ~CPageBlock();

    CPageBlock(const CPageBlock&) = delete;
    CPageBlock& operator=(const CPageBlock&) = delete;

    // Null for an empty block.
    uint8_t* GetData() const {
        auto* block = static_cast<uint8_t*>(m_pBlock);
        return block ? block + (0 - reinterpret_cast<uintptr_t>(block)) % kAlignment : nullptr;
    }

private:
    void* m_pBlock = nullptr;
    size_t m_nBlockBytes = 0;
};

// Deals out consecutive arrays of one block. Adding up the sizes and handing out the pointers are
// two runs over the same calls, so that they cannot disagree: the first run has no block.
class CScratchLayout {
public:
    explicit CScratchLayout(uint8_t* data = nullptr) : m_pData(data) {}

    // Room for count items, aligned for vectors. Without a block the pointer is null.
    template <class T>
    T* Take(size_t count) {
        const size_t offset = m_nBytes;
        const size_t unit = CPageBlock::kAlignment;
        m_nBytes += (count * sizeof(T) + unit - 1) / unit * unit;
        return m_pData ? reinterpret_cast<T*>(m_pData + offset) : nullptr;
    }

    size_t GetBytes() const { return m_nBytes; }

private:
    uint8_t* m_pData;
    size_t m_nBytes = 0;
};

} // namespace kyv
