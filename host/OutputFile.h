// A result that appears under its name only when it is complete.
#pragma once

#include <filesystem>

#include "host/Interrupt.h"

namespace kyvhost {

// Names a temporary file beside the final one, with the same extension. Unless committed it is
// removed at the end, on failure and on interruption.
class COutputFile {
public:
    // Throws CUsageError when the folder does not exist or the name is a folder's.
    explicit COutputFile(const std::filesystem::path& file);
    ~COutputFile();

    COutputFile(const COutputFile&) = delete;
    COutputFile& operator=(const COutputFile&) = delete;

    const std::filesystem::path& Temporary() const { return m_temporary; }

    // Gives the temporary file the final name, in place of a file that has it.
    void Commit();

private:
    std::filesystem::path m_file;
    std::filesystem::path m_temporary;
    CInterruptGuard m_guard;
};

} // namespace kyvhost
