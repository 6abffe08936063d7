// Notes on standard error.
#include "host/Notes.h"

#include <algorithm>
#include <cstdio>

#include "host/ExitStatus.h"

namespace kyvhost {

void CNotes::Say(const std::string& loss) {
    if (m_bStrict) {
        throw CHostError(ExitStatus::RenderingFailed, "--strict: " + loss);
    }
    if (std::find(m_said.begin(), m_said.end(), loss) == m_said.end()) {
        m_said.push_back(loss);
        Tell(loss);
    }
}

void CNotes::Tell(const std::string& line) const {
    if (!m_bQuiet) {
        std::fprintf(stderr, "kyvhost: note: %s\n", line.c_str());
    }
}

} // namespace kyvhost
