// Files of effects: a stack with its values and keyframes, or a preset of one effect. The form is
// told in docs/effect-files.md.
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "host/Hosting.h"
#include "host/Stage.h"

namespace kyvhost {

// Whether the name stands for a file of effects and not for an effect.
bool IsEffectFileName(std::string_view name);

// Reads and checks all of it. Names of further files are relative to the file's folder. Throws
// CHostError with InputUnreadable, and CUsageError with line and key.
std::vector<StageOptions> ReadEffectFile(const ModuleDescriptor& module,
                                         const std::filesystem::path& file);

// The text of such a file, which is to lie at that place. Throws CUsageError.
std::string EffectFileText(const ModuleDescriptor& module, const std::vector<StageOptions>& stages,
                           const std::filesystem::path& file);

} // namespace kyvhost
