// Results appear whole or not at all.
#include "host/OutputFile.h"

#include <cerrno>
#include <fstream>
#include <random>
#include <system_error>

#include "host/ExitStatus.h"
#include "host/FileNames.h"
#include "hosting/Hex.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

namespace fs = std::filesystem;

[[noreturn]] void Unwritable(const fs::path& file, const std::string& why) {
    throw CHostError(ExitStatus::RenderingFailed, TextOf(file) + " cannot be written: " + why);
}

[[noreturn]] void Exists(const fs::path& file) {
    throw CUsageError(TextOf(file) + " exists; --overwrite replaces it");
}

// Where a symbolic link leads, so that the link stays one.
fs::path TargetOf(const fs::path& file) {
    constexpr int kMostLinks = 40;
    fs::path target = file;
    std::error_code error;
    for (int i = 0; i < kMostLinks && fs::is_symlink(target, error); ++i) {
        const fs::path next = fs::read_symlink(target, error);
        target = target.parent_path() / next; // an absolute one replaces all
    }
    return target;
}

// Random, so that two runs do not write one file. The extension tells the kind of file.
fs::path TemporaryName(const fs::path& target, const fs::path& extension) {
    fs::path name = target.stem();
    name += ".part-" + Hex(std::random_device()()).substr(2);
    name += extension;
    return target.parent_path() / name;
}

} // namespace

COutputFile::COutputFile(const fs::path& file, bool overwrite, const std::vector<fs::path>& inputs)
    : m_file(file), m_target(TargetOf(file)),
      m_temporary(TemporaryName(m_target, file.extension())), m_bOverwrite(overwrite),
      m_guard([name = m_temporary] {
          std::error_code error;
          fs::remove(name, error);
      }) {
    std::error_code error;
    const fs::path folder = fs::absolute(m_target).parent_path();
    if (!fs::exists(folder, error)) {
        Unwritable(file, "the folder " + TextOf(folder) + " does not exist");
    }
    if (fs::is_symlink(m_target, error)) {
        Unwritable(file, "its links lead in a circle");
    }
    if (fs::is_directory(m_target, error)) {
        Unwritable(file, "it is a folder; name a file for the result");
    }
    if (fs::exists(m_target, error) && !fs::is_regular_file(m_target, error)) {
        Unwritable(file, "it is no regular file");
    }
    for (const fs::path& input : inputs) {
        if (fs::equivalent(input, m_target, error)) {
            throw CUsageError(TextOf(file) + " is the input " + TextOf(input) +
                              "; name another file for the result");
        }
    }
    if (!overwrite && fs::exists(m_target, error)) {
        Exists(file);
    }
    // Better now than after an hour of rendering.
    errno = 0;
    if (!std::ofstream(m_temporary, std::ios::binary)) {
        Unwritable(file, std::generic_category().message(errno));
    }
    fs::remove(m_temporary, error);
}

COutputFile::~COutputFile() {
    std::error_code error;
    fs::remove(m_temporary, error);
}

void COutputFile::Commit() {
    std::error_code error;
    if (!m_bOverwrite) {
        // Unlike a rename this never replaces. Where the file system has no links a check must do.
        fs::create_hard_link(m_temporary, m_target, error);
        if (!error) {
            return;
        }
        if (fs::exists(m_target)) {
            Exists(m_file);
        }
        error.clear();
    }
    fs::rename(m_temporary, m_target, error);
    if (error) {
        Unwritable(m_file, error.message());
    }
}

COutputSequence::COutputSequence(const fs::path& pattern, bool overwrite,
                                 const std::vector<fs::path>& inputs)
    : m_pattern(pattern),
      m_folder(pattern.parent_path() / PathOf(".part-" + Hex(std::random_device()()).substr(2))),
      m_temporary(m_folder / pattern.filename()), m_inputs(inputs), m_bOverwrite(overwrite),
      m_guard([name = m_folder] {
          std::error_code error;
          fs::remove_all(name, error);
      }) {
    std::error_code error;
    const fs::path folder = fs::absolute(pattern).parent_path();
    if (!fs::exists(folder, error)) {
        Unwritable(pattern, "the folder " + TextOf(folder) + " does not exist");
    }
    for (const fs::path& input : inputs) {
        if (fs::absolute(input) == fs::absolute(pattern)) {
            throw CUsageError(TextOf(pattern) + " is the input; name other files for the result");
        }
    }
    Check(SequenceFile(pattern, 1));
    if (!fs::create_directory(m_folder, error)) {
        Unwritable(pattern, error.message());
    }
}

COutputSequence::~COutputSequence() {
    std::error_code error;
    fs::remove_all(m_folder, error);
}

void COutputSequence::Check(const fs::path& file) const {
    std::error_code error;
    for (const fs::path& input : m_inputs) {
        if (fs::equivalent(input, file, error)) {
            throw CUsageError(TextOf(file) + " is an input; name other files for the result");
        }
    }
    if (fs::exists(file, error) && !m_bOverwrite) {
        Exists(file);
    }
}

void COutputSequence::Commit() {
    std::error_code error;
    std::vector<fs::path> names;
    for (const fs::directory_entry& entry : fs::directory_iterator(m_folder)) {
        names.push_back(entry.path().filename());
        Check(m_pattern.parent_path() / names.back());
    }
    for (const fs::path& name : names) {
        const fs::path place = m_pattern.parent_path() / name;
        fs::rename(m_folder / name, place, error);
        if (error) {
            Unwritable(place, error.message());
        }
    }
}

COutput::COutput(const fs::path& file, bool overwrite, const std::vector<fs::path>& inputs)
    : m_name(file) {
    if (IsSequenceName(file)) {
        m_pSequence = std::make_unique<COutputSequence>(file, overwrite, inputs);
    } else if (!IsDash(file)) {
        m_pFile = std::make_unique<COutputFile>(file, overwrite, inputs);
    }
}

const fs::path& COutput::Temporary() const {
    return m_pFile ? m_pFile->Temporary() : m_pSequence ? m_pSequence->Temporary() : m_name;
}

void COutput::Commit() {
    if (m_pFile) {
        m_pFile->Commit();
    } else if (m_pSequence) {
        m_pSequence->Commit();
    }
}

} // namespace kyvhost
