// A result that appears under its name only when it is complete.
#pragma once

#include <filesystem>
#include <memory>
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

// Numbered files, shot-%04d.png. They are made in a folder of their own beside their place, which
// goes at the end.
class COutputSequence {
public:
    // Throws as COutputFile does, also when a file of the sequence is there already.
    COutputSequence(const std::filesystem::path& pattern, bool overwrite,
                    const std::vector<std::filesystem::path>& inputs);
    ~COutputSequence();

    COutputSequence(const COutputSequence&) = delete;
    COutputSequence& operator=(const COutputSequence&) = delete;

    // The pattern below the folder.
    const std::filesystem::path& Temporary() const { return m_temporary; }

    // Moves the files to their place. Nothing is moved when one is there that is not to be
    // replaced.
    void Commit();

private:
    void Check(const std::filesystem::path& file) const;

    std::filesystem::path m_pattern, m_folder, m_temporary;
    std::vector<std::filesystem::path> m_inputs;
    bool m_bOverwrite;
    CInterruptGuard m_guard;
};

// Whatever the name asks for: a file, numbered files, or standard output, which has no temporary
// form.
class COutput {
public:
    COutput(const std::filesystem::path& file, bool overwrite,
            const std::vector<std::filesystem::path>& inputs);

    const std::filesystem::path& Temporary() const;
    void Commit();

private:
    std::filesystem::path m_name;
    std::unique_ptr<COutputFile> m_pFile;
    std::unique_ptr<COutputSequence> m_pSequence;
};

} // namespace kyvhost
