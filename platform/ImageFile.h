// Pictures in files and in the module's resources, decoded and encoded by the system: GDI+ and an
// optional external decoder on Windows; libpng, libjpeg-turbo, libtiff and a BMP reader of our own
// on Linux.
//
// Pixels are B, G, R, A with straight alpha, rows top down. No function here throws.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "platform/Library.h"
#include "platform/Status.h"

namespace kyv {

// Where a decoder puts a picture.
class CPixelTarget {
public:
    // Gives room for height rows of width * 4 bytes, one after the other, or null when there is
    // none. Called at most once a picture.
    virtual uint8_t* Create(int32_t width, int32_t height) noexcept = 0;

protected:
    ~CPixelTarget() = default;
};

// Pixels to encode: the first byte of the top row, and the bytes from row to row.
struct PixelRows {
    const uint8_t* pixels;
    int32_t width;
    int32_t height;
    int32_t pitch;
};

enum class ImageFormat { Bmp, Jpeg, Png, Tiff };

// The decoding functions return true when the picture in the target counts; after false whatever
// the target received is to be thrown away.

// True when a module has something under a type name (case is ignored) and an id.
bool HasResource(LibraryHandle module, const char* type, uint16_t id);

// A picture in any of the formats, stored in a module under a type name (case is ignored) and an
// id. On Linux only the library that this code is part of has resources.
bool DecodeResource(LibraryHandle module, const char* type, uint16_t id, CPixelTarget& target);

// A picture file. A narrow path is in the ANSI code page on Windows and bytes on Linux; a wide path
// is UTF-16 on Windows, where it has at most kMaxPathUnits - 1 units, and UTF-32 on Linux. The
// option is handed to the external decoder, which may change it.
bool DecodeFile(const char* path, int32_t& decodeOption, CPixelTarget& target);
bool DecodeFile(const wchar_t* path, int32_t& decodeOption, CPixelTarget& target);

// A picture in any of the formats, in memory. No external decoder is asked.
bool DecodeMemory(const uint8_t* file, size_t size, CPixelTarget& target);

// The quality of JPEG files where nobody asks for one.
constexpr int kUsualJpegQuality = 75;

// The bytes of a picture file. quality 1 to 100 is for JPEG alone. kOutOfMemory or kFail.
Status EncodeMemory(ImageFormat format, const PixelRows& source, int quality,
                    std::vector<uint8_t>& file);

// Writes a picture file, replacing one that exists. kOutOfMemory or kFail when it cannot.
Status EncodeFile(const wchar_t* path, ImageFormat format, const PixelRows& source);

} // namespace kyv
