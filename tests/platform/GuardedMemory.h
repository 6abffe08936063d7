// Memory in which every access beside it ends the program, for frames in tests.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kyvtest {

// Bytes that end `slack` bytes before a page that nobody may touch; another such page lies before
// them. What is between them and the pages holds a pattern.
class CGuardedMemory {
public:
    CGuardedMemory(size_t bytes, size_t slack);
    ~CGuardedMemory();
    CGuardedMemory(const CGuardedMemory&) = delete;
    CGuardedMemory& operator=(const CGuardedMemory&) = delete;

    uint8_t* Data() const { return m_pData; }
    size_t Size() const { return m_nBytes; }

    // From now on writing ends the program, too.
    void SetReadOnly();
    // False when something was written between the bytes and the pages.
    bool IsIntact() const;

private:
    uint8_t* m_pPages = nullptr; // those that may be touched
    size_t m_nPageBytes = 0;
    uint8_t* m_pData = nullptr;
    size_t m_nBytes = 0;
};

} // namespace kyvtest
