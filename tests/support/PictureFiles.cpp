// Picture files for tests.
#include "tests/support/PictureFiles.h"

#include <fstream>
#include <iterator>
#include <random>

#include <gtest/gtest.h>

namespace kyvtest {
namespace {

namespace fs = std::filesystem;

void PutBig(Bytes& file, size_t at, uint32_t value, int count) {
    for (int i = count; i-- > 0; value >>= 8) {
        file.at(at + static_cast<size_t>(i)) = static_cast<uint8_t>(value);
    }
}

void PutLittle(Bytes& file, size_t at, uint32_t value, int count) {
    for (int i = 0; i < count; ++i, value >>= 8) {
        file.at(at + static_cast<size_t>(i)) = static_cast<uint8_t>(value);
    }
}

uint32_t Little(const Bytes& file, size_t at, int count) {
    uint32_t value = 0;
    for (int i = count; i-- > 0;) {
        value = value << 8 | file.at(at + static_cast<size_t>(i));
    }
    return value;
}

// The checksum of a PNG chunk.
uint32_t Crc(const Bytes& file, size_t at, size_t size) {
    uint32_t crc = 0xFFFFFFFF;
    for (size_t i = at; i < at + size; ++i) {
        crc ^= file.at(i);
        for (int bit = 0; bit < 8; ++bit) {
            crc = crc >> 1 ^ (crc & 1 ? 0xEDB88320 : 0);
        }
    }
    return ~crc;
}

void SetPngSize(Bytes& file, uint32_t width, uint32_t height) {
    PutBig(file, 16, width, 4);
    PutBig(file, 20, height, 4);
    PutBig(file, 29, Crc(file, 12, 17), 4);
}

void SetJpegSize(Bytes& file, uint32_t width, uint32_t height) {
    for (size_t at = 2; at + 9 < file.size() && file[at] == 0xFF;) {
        const uint8_t marker = file[at + 1];
        if (marker >= 0xC0 && marker <= 0xC2) {
            PutBig(file, at + 5, height, 2);
            PutBig(file, at + 7, width, 2);
            return;
        }
        at += 2 + (size_t{file[at + 2]} << 8 | file[at + 3]);
    }
    ADD_FAILURE() << "no frame header";
}

// Width and height are the directory entries 256 and 257; ours are little-endian files.
void SetTiffSize(Bytes& file, uint32_t width, uint32_t height) {
    constexpr uint32_t kLong = 4;
    const size_t directory = Little(file, 4, 4);
    const uint32_t count = Little(file, directory, 2);
    int found = 0;
    for (uint32_t i = 0; i < count; ++i) {
        const size_t entry = directory + 2 + size_t{12} * i;
        const uint32_t tag = Little(file, entry, 2);
        if (tag == 256 || tag == 257) {
            PutLittle(file, entry + 2, kLong, 2);
            PutLittle(file, entry + 8, tag == 256 ? width : height, 4);
            ++found;
        }
    }
    EXPECT_EQ(found, 2);
}

} // namespace

CTempFolder::CTempFolder()
    : m_path(fs::temp_directory_path() / ("kyvdsp" + std::to_string(std::random_device()()))) {
    fs::create_directories(m_path);
}

CTempFolder::~CTempFolder() {
    std::error_code ignored;
    fs::remove_all(m_path, ignored);
}

Bytes CTempFolder::Read(const char* name) const {
    std::ifstream file(Path(name), std::ios::binary);
    EXPECT_TRUE(file) << name;
    return {std::istreambuf_iterator<char>(file), {}};
}

void CTempFolder::Write(const char* name, const Bytes& bytes) const {
    std::ofstream file(Path(name), std::ios::binary);
    file.write(reinterpret_cast<const char*>(bytes.data()),
               static_cast<std::streamsize>(bytes.size()));
    EXPECT_TRUE(file) << name;
}

Bytes WithSize(const Bytes& file, uint32_t width, uint32_t height) {
    Bytes changed = file;
    switch (file.at(0)) {
    case 0x89:
        SetPngSize(changed, width, height);
        break;
    case 0xFF:
        SetJpegSize(changed, width, height);
        break;
    case 'I':
        SetTiffSize(changed, width, height);
        break;
    case 'B':
        PutLittle(changed, 18, width, 4);
        PutLittle(changed, 22, height, 4);
        break;
    default:
        ADD_FAILURE() << "no picture file";
    }
    return changed;
}

} // namespace kyvtest
