// Picture files and picture resources on Linux.
#include "platform/ImageFile.h"

#include <algorithm>
#include <cerrno>
#include <initializer_list>
#include <new>
#include <string>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/posix/ImageCodecs.h"
#include "platform/posix/Resource.h"

namespace kyv {
namespace {

class CFile {
public:
    // Opening a pipe or a device must not wait.
    CFile(const char* path, int flags)
        : m_nFile(open(path, flags | O_CLOEXEC | O_NONBLOCK, 0666)) {}
    ~CFile() {
        if (m_nFile >= 0) {
            close(m_nFile);
        }
    }

    CFile(const CFile&) = delete;
    CFile& operator=(const CFile&) = delete;

    bool IsOpen() const { return m_nFile >= 0; }

    // The whole of a regular file. One that shrinks meanwhile is a failure, and so is one that is
    // too big for any picture that we would take.
    bool ReadAll(Bytes& bytes) const {
        constexpr off_t kMaxBytes = off_t{1} << 32;
        struct stat attributes;
        if (fstat(m_nFile, &attributes) != 0 || !S_ISREG(attributes.st_mode) ||
            attributes.st_size > kMaxBytes) {
            return false;
        }
        bytes.resize(static_cast<size_t>(attributes.st_size));
        for (size_t done = 0; done < bytes.size();) {
            const ssize_t count = read(m_nFile, bytes.data() + done, bytes.size() - done);
            if (count <= 0 && !(count < 0 && errno == EINTR)) {
                return false;
            }
            done += count > 0 ? static_cast<size_t>(count) : 0;
        }
        return true;
    }

    bool WriteAll(const Bytes& bytes) const {
        for (size_t done = 0; done < bytes.size();) {
            const ssize_t count = write(m_nFile, bytes.data() + done, bytes.size() - done);
            if (count <= 0 && !(count < 0 && errno == EINTR)) {
                return false;
            }
            done += count > 0 ? static_cast<size_t>(count) : 0;
        }
        return true;
    }

private:
    int m_nFile;
};

// UTF-32 to UTF-8; false for what is no character.
bool ToUtf8(const wchar_t* text, std::string& utf8) {
    static_assert(sizeof(wchar_t) == 4);
    for (; *text; ++text) {
        const auto c = static_cast<char32_t>(*text);
        if (c > 0x10FFFF || (c >= 0xD800 && c <= 0xDFFF)) {
            return false;
        }
        if (c < 0x80) {
            utf8 += static_cast<char>(c);
            continue;
        }
        const int following = c < 0x800 ? 1 : c < 0x10000 ? 2 : 3;
        utf8 += static_cast<char>((0xF00 >> following & 0xFF) | c >> (6 * following));
        for (int i = following; i-- > 0;) {
            utf8 += static_cast<char>(0x80 | (c >> (6 * i) & 0x3F));
        }
    }
    return true;
}

bool Encode(ImageFormat format, const PixelRows& source, int quality, Bytes& file) {
    switch (format) {
    case ImageFormat::Bmp:
        return EncodeBmp(source, file);
    case ImageFormat::Jpeg:
        return EncodeJpeg(source, quality, file);
    case ImageFormat::Png:
        return EncodePng(source, file);
    case ImageFormat::Tiff:
        return EncodeTiff(source, file);
    }
    return false;
}

} // namespace

bool DecodeImage(ByteView file, CPixelTarget& target) {
    const auto Begins = [&](std::initializer_list<uint8_t> magic) {
        return file.size >= magic.size() && std::equal(magic.begin(), magic.end(), file.data);
    };
    if (Begins({0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'})) {
        return DecodePng(file, target);
    }
    if (Begins({0xFF, 0xD8, 0xFF})) {
        return DecodeJpeg(file, target);
    }
    if (Begins({'I', 'I', '*', 0}) || Begins({'M', 'M', 0, '*'})) {
        return DecodeTiff(file, target);
    }
    return Begins({'B', 'M'}) && DecodeBmp(file, target);
}

bool HasResource(LibraryHandle module, const char* type, uint16_t id) {
    return FindResource(module, type, id).size > 0;
}

bool DecodeResource(LibraryHandle module, const char* type, uint16_t id, CPixelTarget& target) {
    try {
        return DecodeImage(FindResource(module, type, id), target);
    } catch (const std::bad_alloc&) {
        return false;
    }
}

bool DecodeFile(const char* path, int32_t&, CPixelTarget& target) {
    try {
        Bytes bytes;
        if (!path) {
            return false;
        }
        const CFile file(path, O_RDONLY);
        return file.IsOpen() && file.ReadAll(bytes) &&
               DecodeImage({bytes.data(), bytes.size()}, target);
    } catch (const std::exception&) {
        return false; // no memory for the file
    }
}

bool DecodeFile(const wchar_t* path, int32_t& decodeOption, CPixelTarget& target) {
    try {
        std::string utf8;
        return path && ToUtf8(path, utf8) && DecodeFile(utf8.c_str(), decodeOption, target);
    } catch (const std::bad_alloc&) {
        return false;
    }
}

bool DecodeMemory(const uint8_t* file, size_t size, CPixelTarget& target) {
    try {
        return DecodeImage({file, size}, target);
    } catch (const std::bad_alloc&) {
        return false;
    }
}

Status EncodeMemory(ImageFormat format, const PixelRows& source, int quality,
                    std::vector<uint8_t>& file) {
    try {
        file.clear();
        return Encode(format, source, quality, file) ? kOk : kFail;
    } catch (const std::bad_alloc&) {
        return kOutOfMemory;
    }
}

// The file is made in memory first, so that a picture that cannot be encoded leaves a file of that
// name alone.
Status EncodeFile(const wchar_t* path, ImageFormat format, const PixelRows& source) {
    try {
        std::string utf8;
        Bytes bytes;
        if (!ToUtf8(path, utf8) || !Encode(format, source, kUsualJpegQuality, bytes)) {
            return kFail;
        }
        const CFile file(utf8.c_str(), O_WRONLY | O_CREAT | O_TRUNC);
        if (!file.IsOpen()) {
            return kFail;
        }
        if (!file.WriteAll(bytes)) {
            unlink(utf8.c_str());
            return kFail;
        }
        return kOk;
    } catch (const std::bad_alloc&) {
        return kOutOfMemory;
    }
}

} // namespace kyv
