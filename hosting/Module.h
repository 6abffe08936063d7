// The module: loaded at run time, reached through the public header alone.
#pragma once

#include <filesystem>

#include "interface/HostInterface.h"

namespace kyvhost {

// Where the module lies when the user names none: beside the program, else where the build tree
// and an installation have it. Throws CHostError when it is in none of these places.
std::filesystem::path DefaultModuleFile();

// A loaded and initialised module. Throws CHostError with ModuleNotUsable when the file is missing
// or no library, lacks an export, refuses to start, or speaks another format number.
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

} // namespace kyvhost
