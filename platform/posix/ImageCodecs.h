// The picture formats on Linux, from memory to pixels and back. Only this folder includes it, and
// the fuzz targets.
//
// A decoder takes a picture whole or not at all: a cut-off file, a checksum that is wrong or a
// damaged row is a failure, and nothing of it counts. Nothing is printed and nothing thrown.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "platform/ImageFile.h"

namespace kyv {

struct ByteView {
    const uint8_t* data;
    size_t size;
};

using Bytes = std::vector<uint8_t>;

// The format is told by the first bytes. Each is also decoded by name.
bool DecodeImage(ByteView file, CPixelTarget& target);
bool DecodePng(ByteView file, CPixelTarget& target);
bool DecodeJpeg(ByteView file, CPixelTarget& target);
bool DecodeTiff(ByteView file, CPixelTarget& target);

// A BMP file; pixels without alpha are opaque, as a picture's are.
bool DecodeBmp(ByteView file, CPixelTarget& target);

// A bitmap as resources hold it: a BMP file without its file header. Pixels without alpha have 0
// in the fourth byte, and 32-bit pixels keep what is there, as GDI gives them.
bool DecodeDib(ByteView dib, CPixelTarget& target);

// False when memory runs out or the format cannot hold the picture.
bool EncodePng(const PixelRows& source, Bytes& file);
bool EncodeJpeg(const PixelRows& source, int quality, Bytes& file); // 1 to 100
bool EncodeTiff(const PixelRows& source, Bytes& file);
bool EncodeBmp(const PixelRows& source, Bytes& file);

// Whether a header's size deserves memory: it must be positive, its pixels within 2 GB, and its
// data (bytes before compression) no more than the file's bytes can unfold to. The last keeps a
// few bytes of nonsense from reserving gigabytes.
inline bool IsPlausible(uint64_t width, uint64_t height, uint64_t dataBytes, size_t fileBytes,
                        uint32_t bestCompression) {
    constexpr uint64_t kMaxSide = 0x1FFFFFFF; // so that the products below stay within 64 bits
    return width >= 1 && height >= 1 && width <= kMaxSide && height <= kMaxSide &&
           width * height <= kMaxSide && dataBytes / bestCompression <= fileBytes;
}

// 16-bit samples to 8 bits, rounded: v * 255 / 65535.
inline uint8_t NarrowSample(uint16_t value) {
    return static_cast<uint8_t>((uint32_t{value} * 255 + 32895) >> 16);
}

} // namespace kyv
