// Results appear whole or not at all.
#include "host/OutputFile.h"

#include <random>

#include "host/ExitStatus.h"
#include "host/Hex.h"
#include "host/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

// Random, so that two runs do not write one file.
fs::path TemporaryName(const fs::path& file) {
    fs::path name = file.stem();
    name += ".part-" + Hex(std::random_device()()).substr(2);
    name += file.extension();
    return file.parent_path() / name;
}

} // namespace

COutputFile::COutputFile(const fs::path& file)
    : m_file(file), m_temporary(TemporaryName(file)), m_guard([name = m_temporary] {
          std::error_code error;
          fs::remove(name, error);
      }) {
    std::error_code error;
    const fs::path folder = fs::absolute(file).parent_path();
    if (!fs::is_directory(folder, error)) {
        throw CUsageError(TextOf(file) + ": the folder " + TextOf(folder) + " does not exist");
    }
    if (fs::is_directory(file, error)) {
        throw CUsageError(TextOf(file) + " is a folder; name a file for the result");
    }
}

COutputFile::~COutputFile() {
    std::error_code error;
    fs::remove(m_temporary, error);
}

void COutputFile::Commit() {
    std::error_code error;
    fs::rename(m_temporary, m_file, error);
    if (error) {
        throw CHostError(ExitStatus::RenderingFailed,
                         TextOf(m_file) +
                             ": the result cannot be given this name: " + error.message());
    }
}

} // namespace kyvhost
