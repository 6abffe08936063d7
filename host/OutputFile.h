// A result that appears under its name only when it is complete.
#pragma once

#include <filesystem>
#include <vector>

#include "host/Interrupt.h"

namespace kyvhost {

// Names a temporary file beside the final one, with the same extension. Unless committed it is
// removed at the end, on failure and on interruption.
class COutputFile {
public:
    // A symbolic link stands for its target. Throws CHostError when nothing can be written there,
    // and CUsageError when the file is one of the inputs, under whatever name, or when it exists
    // and is not to be replaced.
    COutputFile(const std::filesystem::path& file, bool overwrite,
                const std::vector<std::filesystem::path>& inputs);
    ~COutputFile();

    COutputFile(const COutputFile&) = delete;
    COutputFile& operator=(const COutputFile&) = delete;

    // What the user has named.
    const std::filesystem::path& Name() const { return m_file; }

    const std::filesystem::path& Temporary() const { return m_temporary; }

    // Gives the temporary file the final name. A file that has it meanwhile is replaced only when
    // that was asked for.
    void Commit();

private:
    std::filesystem::path m_file, m_target; // what the user has named, and where it leads
    std::filesystem::path m_temporary;
    bool m_bOverwrite;
    CInterruptGuard m_guard;
};

} // namespace kyvhost
