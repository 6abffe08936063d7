// Picture files for tests: a folder for them, and headers that lie.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace kyvtest {

using Bytes = std::vector<uint8_t>;

// A new folder that is removed again with all it holds.
class CTempFolder {
public:
    CTempFolder();
    ~CTempFolder();

    CTempFolder(const CTempFolder&) = delete;
    CTempFolder& operator=(const CTempFolder&) = delete;

    std::filesystem::path Path(const char* name) const { return m_path / name; }
    std::wstring Wide(const char* name) const { return Path(name).wstring(); }
    std::string Narrow(const char* name) const { return Path(name).string(); }

    Bytes Read(const char* name) const;
    void Write(const char* name, const Bytes& bytes) const;

private:
    std::filesystem::path m_path;
};

// A copy of a PNG, JPEG, TIFF or BMP file whose header states another size, with the header's
// checksum made right. JPEG holds the lower 16 bits.
Bytes WithSize(const Bytes& file, uint32_t width, uint32_t height);

} // namespace kyvtest
