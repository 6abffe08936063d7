// What is the same on every system.
#include "tests/platform/GuardedMemory.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "tests/platform/Pages.h"

namespace kyvtest {
namespace {

constexpr uint8_t kPattern = 0xC7;

} // namespace

CGuardedMemory::CGuardedMemory(size_t bytes, size_t slack) : m_nBytes(bytes) {
    const size_t page = PageBytes();
    m_nPageBytes = (bytes + slack + page - 1) / page * page;
    auto* const all = static_cast<uint8_t*>(ReservePages(m_nPageBytes + 2 * page));
    if (!all || !ProtectPages(all + page, m_nPageBytes, true)) {
        std::abort();
    }
    m_pPages = all + page;
    m_pData = m_pPages + m_nPageBytes - slack - bytes;
    std::memset(m_pPages, kPattern, m_nPageBytes);
}

CGuardedMemory::~CGuardedMemory() {
    ReleasePages(m_pPages - PageBytes(), m_nPageBytes + 2 * PageBytes());
}

void CGuardedMemory::SetReadOnly() {
    ProtectPages(m_pPages, m_nPageBytes, false);
}

bool CGuardedMemory::IsIntact() const {
    const auto isPattern = [](uint8_t byte) { return byte == kPattern; };
    return std::all_of(m_pPages, m_pData, isPattern) &&
           std::all_of(m_pData + m_nBytes, m_pPages + m_nPageBytes, isPattern);
}

} // namespace kyvtest
