// The module: loaded at run time, reached through the public header alone.
#pragma once

#include <filesystem>
#include <vector>

#include "interface/HostInterface.h"

namespace kyvhosting {

// The module's file in the first of the folders that has it; empty when none does.
std::filesystem::path FindModuleFile(const std::vector<std::filesystem::path>& folders);

// A loaded and initialised module. Throws CModuleError when the file is missing or no library,
// lacks an export, refuses to start, speaks another format number or has records without names or
// callbacks.
//
// A program may load the same file any number of times: all get the same descriptor. The first
// that goes takes the texts of the language library away from the others, so whoever shares a
// process with other hosts of the module keeps theirs.
class CModule {
public:
    explicit CModule(const std::filesystem::path& file);
    ~CModule(); // DeInitModule, then unloads

    CModule(const CModule&) = delete;
    CModule& operator=(const CModule&) = delete;

    const ModuleDescriptor& Descriptor() const { return *m_pDescriptor; }
    const std::filesystem::path& File() const { return m_file; }

private:
    void Check() const;

    std::filesystem::path m_file;
    KyvModuleHandle m_library = nullptr;
    KyvDeInitModuleFunction m_pDeInit = nullptr;
    ModuleDescriptor* m_pDescriptor = nullptr;
};

} // namespace kyvhosting
