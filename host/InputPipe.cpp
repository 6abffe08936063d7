// Inputs that can be read only once.
#include "host/InputPipe.h"

#include <algorithm>

#include "host/ExitStatus.h"
#include "host/FileNames.h"
#include "hosting/Text.h"
#include "platform/Console.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

constexpr size_t kPieceBytes = 1 << 16;

} // namespace

CInputPipe::CInputPipe(const fs::path& file) : m_bStandard(IsDash(file)) {
    if (!m_bStandard) {
        m_stream.open(file, std::ios::binary);
        if (!m_stream) {
            throw CHostError(ExitStatus::InputUnreadable,
                             TextOf(file) + ": the pipe cannot be opened");
        }
    }
}

bool CInputPipe::ReadMore() {
    const size_t have = m_kept.size();
    m_kept.resize(have + kPieceBytes);
    size_t count = 0;
    if (m_bStandard) {
        count = kyv::ReadStandardInput(m_kept.data() + have, kPieceBytes);
    } else {
        m_stream.read(reinterpret_cast<char*>(m_kept.data() + have), kPieceBytes);
        count = static_cast<size_t>(m_stream.gcount());
    }
    m_kept.resize(have + count);
    return count > 0;
}

std::span<const uint8_t> CInputPipe::Peek(size_t size) {
    const std::lock_guard lock(m_mutex);
    while (m_kept.size() < size && ReadMore()) {
    }
    return {m_kept.data(), std::min(size, m_kept.size())};
}

std::span<const uint8_t> CInputPipe::ReadAll() {
    const std::lock_guard lock(m_mutex);
    while (ReadMore()) {
    }
    return m_kept;
}

void CInputPipe::Pass(const std::function<bool(const void*, size_t)>& take, bool keep) {
    const std::lock_guard lock(m_mutex);
    size_t passed = 0;
    do {
        if (passed < m_kept.size()) {
            if (!take(m_kept.data() + passed, m_kept.size() - passed)) {
                return;
            }
            passed = m_kept.size();
        }
        if (!keep) {
            m_kept.clear();
            passed = 0;
        }
    } while (ReadMore());
}

} // namespace kyvhost
