// Names on the command line that stand for something else than a plain file.
#pragma once

#include <filesystem>

namespace kyvhost {

// "-", the name of standard input and standard output.
bool IsDash(const std::filesystem::path& file);

// Whether the file is standard input, a pipe or a device, which nobody can read twice.
bool IsPipe(const std::filesystem::path& file);

// Whether the name stands for numbered files: shot-%04d.png, or %d.
bool IsSequenceName(const std::filesystem::path& file);

// The name of one of them.
std::filesystem::path SequenceFile(const std::filesystem::path& pattern, long number);

} // namespace kyvhost
