// Sizes in the headers of picture files.
#include "platform/win32/PictureSize.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <initializer_list>

#include <windows.h>

namespace kyv {
namespace {

// Two bytes a sample and four samples a pixel then stay within 2 GB.
constexpr uint64_t kMaxPixels = uint64_t{1} << 28;

bool IsSane(uint64_t width, uint64_t height) {
    return width >= 1 && height >= 1 && width <= kMaxPixels && height <= kMaxPixels &&
           width * height <= kMaxPixels;
}

uint32_t Big(const uint8_t* bytes, int count) {
    uint32_t value = 0;
    for (int i = 0; i < count; ++i) {
        value = value << 8 | bytes[i];
    }
    return value;
}

uint32_t Little(const uint8_t* bytes, int count) {
    uint32_t value = 0;
    for (int i = count; i-- > 0;) {
        value = value << 8 | bytes[i];
    }
    return value;
}

bool IsSanePng(CByteSource& picture) {
    uint8_t size[8];
    return picture.ReadAt(16, size, sizeof size) && IsSane(Big(size, 4), Big(size + 4, 4));
}

bool IsSaneGif(CByteSource& picture) {
    uint8_t size[4];
    return picture.ReadAt(6, size, sizeof size) && IsSane(Little(size, 2), Little(size + 2, 2));
}

bool IsSaneBmp(CByteSource& picture) {
    uint8_t header[12];
    if (!picture.ReadAt(14, header, sizeof header)) {
        return false;
    }
    if (Little(header, 4) == sizeof header) { // the oldest kind
        return IsSane(Little(header + 4, 2), Little(header + 6, 2));
    }
    const auto height = int64_t{static_cast<int32_t>(Little(header + 8, 4))};
    return IsSane(Little(header + 4, 4), static_cast<uint64_t>(height < 0 ? -height : height));
}

// Segments up to the frame's header: a mark, its size with itself, and as many bytes.
bool IsSaneJpeg(CByteSource& picture) {
    constexpr int kMaxSegments = 4096;
    uint64_t at = 2;
    for (int i = 0; i < kMaxSegments; ++i) {
        uint8_t segment[9];
        if (!picture.ReadAt(at, segment, 4) || segment[0] != 0xFF) {
            return false;
        }
        const uint8_t mark = segment[1];
        if (mark == 0xFF) { // fill
            ++at;
            continue;
        }
        // A mark without a segment has no business here, and would lead the walk astray.
        if (mark < 0xC0 || (mark >= 0xD0 && mark <= 0xD9) || Big(segment + 2, 2) < 2) {
            return false;
        }
        const bool isFrame =
            mark >= 0xC0 && mark <= 0xCF && mark != 0xC4 && mark != 0xC8 && mark != 0xCC;
        if (isFrame) {
            return picture.ReadAt(at, segment, sizeof segment) &&
                   IsSane(Big(segment + 7, 2), Big(segment + 5, 2));
        }
        at += 2 + Big(segment + 2, 2);
    }
    return false;
}

// The first directory's entries: width, height and, where there are tiles, theirs.
bool IsSaneTiff(CByteSource& picture, bool isBig) {
    constexpr uint32_t kMaxEntries = 4096;
    constexpr uint32_t kTags[] = {256, 257, 322, 323};
    enum : uint32_t { Byte = 1, Short = 3, Long = 4 };
    const auto Number = [&](const uint8_t* bytes, int count) {
        return isBig ? Big(bytes, count) : Little(bytes, count);
    };
    uint8_t bytes[12];
    if (!picture.ReadAt(4, bytes, 4)) {
        return false;
    }
    const uint64_t directory = Number(bytes, 4);
    if (!picture.ReadAt(directory, bytes, 2)) {
        return false;
    }
    const uint32_t entries = Number(bytes, 2);
    std::array<uint32_t, 4> values = {0, 0, 1, 1};
    for (uint32_t i = 0; i < std::min(entries, kMaxEntries); ++i) {
        if (!picture.ReadAt(directory + 2 + uint64_t{12} * i, bytes, sizeof bytes)) {
            return false;
        }
        const auto* const tag = std::find(std::begin(kTags), std::end(kTags), Number(bytes, 2));
        if (tag == std::end(kTags)) {
            continue;
        }
        // A second entry of the same tag could be the one that counts: the larger does here.
        const uint32_t type = Number(bytes + 2, 2);
        const int size = type == Byte ? 1 : type == Short ? 2 : type == Long ? 4 : 0;
        uint32_t& value = values.at(static_cast<size_t>(tag - std::begin(kTags)));
        if (size == 0 || Number(bytes + 4, 4) != 1 || Number(bytes + 8, size) == 0) {
            return false;
        }
        value = std::max(value, Number(bytes + 8, size));
    }
    return entries <= kMaxEntries && IsSane(values[0], values[1]) && IsSane(values[2], values[3]);
}

} // namespace

bool CMemorySource::ReadAt(uint64_t offset, void* bytes, size_t count) {
    if (offset > m_nSize || count > m_nSize - offset) {
        return false;
    }
    std::memcpy(bytes, m_pBytes + offset, count);
    return true;
}

CFileSource::CFileSource(const wchar_t* path)
    : m_hFile(CreateFileW(path, GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                          FILE_ATTRIBUTE_NORMAL, nullptr)) {}

CFileSource::~CFileSource() {
    if (m_hFile != INVALID_HANDLE_VALUE) {
        CloseHandle(m_hFile);
    }
}

bool CFileSource::ReadAt(uint64_t offset, void* bytes, size_t count) {
    OVERLAPPED place = {};
    place.Offset = static_cast<DWORD>(offset);
    place.OffsetHigh = static_cast<DWORD>(offset >> 32);
    DWORD done = 0;
    return m_hFile != INVALID_HANDLE_VALUE &&
           ReadFile(m_hFile, bytes, static_cast<DWORD>(count), &done, &place) && done == count;
}

bool HasSaneSize(CByteSource& picture) {
    uint8_t magic[4];
    if (!picture.ReadAt(0, magic, sizeof magic)) {
        return false;
    }
    const auto Begins = [&](std::initializer_list<uint8_t> bytes) {
        return std::equal(bytes.begin(), bytes.end(), magic);
    };
    if (Begins({0x89, 'P', 'N', 'G'})) {
        return IsSanePng(picture);
    }
    if (Begins({0xFF, 0xD8})) {
        return IsSaneJpeg(picture);
    }
    if (Begins({'I', 'I', '*', 0}) || Begins({'M', 'M', 0, '*'})) {
        return IsSaneTiff(picture, magic[0] == 'M');
    }
    if (Begins({'I', 'I', '+'}) || Begins({'M', 'M', 0, '+'})) {
        return false; // 64-bit TIFF, which GDI+ is not to know
    }
    if (Begins({'B', 'M'})) {
        return IsSaneBmp(picture);
    }
    return !Begins({'G', 'I', 'F'}) || IsSaneGif(picture);
}

} // namespace kyv
