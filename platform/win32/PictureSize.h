// The size that a picture's header states, read before GDI+ sees the picture.
//
// GDI+ hands a file to decoders that multiply width, height and bytes in 32 bits and believe the
// result, some of them while the bitmap is made. A header must not decide where they write.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kyv {

// Bytes that can be read at any place.
class CByteSource {
public:
    // False when they are not all there.
    virtual bool ReadAt(uint64_t offset, void* bytes, size_t count) = 0;

protected:
    ~CByteSource() = default;
};

class CMemorySource final : public CByteSource {
public:
    CMemorySource(const void* bytes, size_t size)
        : m_pBytes(static_cast<const uint8_t*>(bytes)), m_nSize(size) {}
    bool ReadAt(uint64_t offset, void* bytes, size_t count) override;

private:
    const uint8_t* m_pBytes;
    size_t m_nSize;
};

// Nothing can be read where the file cannot be opened. The path is an ordinary one.
class CFileSource final : public CByteSource {
public:
    explicit CFileSource(const wchar_t* path);
    ~CFileSource();
    CFileSource(const CFileSource&) = delete;
    CFileSource& operator=(const CFileSource&) = delete;

    bool ReadAt(uint64_t offset, void* bytes, size_t count) override;

private:
    void* m_hFile;
};

// False for a PNG, JPEG, TIFF, BMP or GIF whose header states no size, a side of 0 or more than
// 2^28 pixels (16384 x 16384), and for what cannot be read. Other formats are GDI+'s to judge.
bool HasSaneSize(CByteSource& picture);

} // namespace kyv
