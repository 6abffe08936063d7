// BMP files and the bitmaps of resources: 1 to 32 bits a pixel, palettes, colour masks and run
// lengths.
#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <limits>

#include "platform/posix/ImageCodecs.h"

namespace kyv {
namespace {

constexpr size_t kFileHeaderBytes = 14;
constexpr uint32_t kCoreHeaderBytes = 12;
constexpr uint32_t kInfoHeaderBytes = 40;

enum class Packing : uint32_t { Rgb = 0, Rle8 = 1, Rle4 = 2, BitFields = 3, AlphaBitFields = 6 };

// Little-endian numbers; the caller has checked the size.
uint32_t Read16(const uint8_t* bytes) {
    return bytes[0] | uint32_t{bytes[1]} << 8;
}
uint32_t Read32(const uint8_t* bytes) {
    return Read16(bytes) | Read16(bytes + 2) << 16;
}

void Append16(Bytes& file, uint32_t value) {
    file.push_back(static_cast<uint8_t>(value));
    file.push_back(static_cast<uint8_t>(value >> 8));
}
void Append32(Bytes& file, uint32_t value) {
    Append16(file, value);
    Append16(file, value >> 16);
}

using Pixel = std::array<uint8_t, 4>;

struct Dib {
    int32_t width;
    int32_t height;
    bool isTopDown;
    uint32_t bits;
    Packing packing;
    uint32_t masks[4]; // red, green, blue, alpha
    size_t pixelOffset;
    std::array<Pixel, 256> palette;
};

// The bits that a mask selects, spread to 8.
class CMaskedChannel {
public:
    explicit CMaskedChannel(uint32_t mask) : m_nMask(mask) {
        if (mask == 0) {
            return;
        }
        const int low = std::countr_zero(mask);
        const int bits = std::popcount(mask);
        m_nUsedBits = std::min(bits, 8);
        m_nShift = low + bits - m_nUsedBits;
    }

    // The top bits repeat below, so that all ones are 255.
    uint8_t Of(uint32_t pixel) const {
        if (m_nMask == 0) {
            return 0;
        }
        uint32_t value = ((pixel & m_nMask) >> m_nShift) << (8 - m_nUsedBits);
        for (int filled = m_nUsedBits; filled < 8; filled *= 2) {
            value |= value >> filled;
        }
        return static_cast<uint8_t>(value);
    }

private:
    uint32_t m_nMask;
    int m_nUsedBits = 0;
    int m_nShift = 0;
};

bool IsContiguous(uint32_t mask) {
    return mask == 0 || std::has_single_bit((uint64_t{mask} >> std::countr_zero(mask)) + 1);
}

bool IsKnown(const Dib& dib) {
    switch (dib.packing) {
    case Packing::Rgb:
        return dib.bits == 1 || dib.bits == 4 || dib.bits == 8 || dib.bits == 16 ||
               dib.bits == 24 || dib.bits == 32;
    case Packing::Rle8:
        return dib.bits == 8 && !dib.isTopDown;
    case Packing::Rle4:
        return dib.bits == 4 && !dib.isTopDown;
    case Packing::BitFields:
    case Packing::AlphaBitFields:
        return (dib.bits == 16 || dib.bits == 32) &&
               std::all_of(std::begin(dib.masks), std::end(dib.masks), IsContiguous);
    }
    return false;
}

size_t RowBytes(const Dib& dib) {
    return (size_t{dib.bits} * dib.width + 31) / 32 * 4;
}

bool ReadPalette(ByteView bytes, size_t offset, uint32_t count, size_t entryBytes, Dib& dib) {
    if (offset + count * entryBytes > bytes.size) {
        return false;
    }
    for (uint32_t i = 0; i < std::min(count, 256U); ++i) {
        const uint8_t* entry = bytes.data + offset + i * entryBytes;
        dib.palette[i] = {entry[0], entry[1], entry[2], 0};
    }
    return true;
}

// The masks of the header, or those that the bits stand for; end moves behind what was read.
bool ReadMasks(ByteView bytes, uint32_t headerBytes, size_t& end, Dib& dib) {
    if (dib.packing != Packing::BitFields && dib.packing != Packing::AlphaBitFields) {
        constexpr uint32_t kOf16[] = {0x7C00, 0x03E0, 0x001F};
        constexpr uint32_t kOfOthers[] = {0xFF0000, 0x00FF00, 0x0000FF};
        std::copy_n(dib.bits == 16 ? kOf16 : kOfOthers, 3, dib.masks);
        return true;
    }
    // Behind the oldest header, inside the newer ones.
    const size_t count = dib.packing == Packing::AlphaBitFields || headerBytes >= 56 ? 4 : 3;
    const size_t masksEnd = kInfoHeaderBytes + count * 4;
    if (masksEnd > bytes.size) {
        return false;
    }
    for (size_t i = 0; i < count; ++i) {
        dib.masks[i] = Read32(bytes.data + kInfoHeaderBytes + i * 4);
    }
    end = std::max(end, masksEnd);
    return true;
}

// Fills all but, for files, the place of the pixels, which their own header tells.
bool ReadHeader(ByteView bytes, Dib& dib) {
    if (bytes.size < kCoreHeaderBytes) {
        return false;
    }
    const uint32_t headerBytes = Read32(bytes.data);
    const bool isCore = headerBytes == kCoreHeaderBytes;
    if (headerBytes > bytes.size || (!isCore && headerBytes < kInfoHeaderBytes)) {
        return false;
    }
    const auto At32 = [&](size_t offset) { return Read32(bytes.data + offset); };
    int64_t height = 0;
    uint32_t colors = 0;
    dib.packing = Packing::Rgb;
    if (isCore) {
        dib.width = static_cast<int32_t>(Read16(bytes.data + 4));
        height = Read16(bytes.data + 6);
        dib.bits = Read16(bytes.data + 10);
    } else {
        dib.width = static_cast<int32_t>(At32(4));
        height = static_cast<int32_t>(At32(8));
        dib.bits = Read16(bytes.data + 14);
        dib.packing = static_cast<Packing>(At32(16));
        colors = At32(32);
    }
    dib.isTopDown = height < 0;
    height = dib.isTopDown ? -height : height;
    if (dib.width <= 0 || height <= 0 || height > std::numeric_limits<int32_t>::max()) {
        return false;
    }
    dib.height = static_cast<int32_t>(height);

    size_t end = headerBytes;
    if (!ReadMasks(bytes, headerBytes, end, dib) || !IsKnown(dib)) {
        return false;
    }
    const size_t entryBytes = isCore ? 3 : 4;
    if (dib.bits <= 8) {
        colors = colors == 0 ? 1U << dib.bits : colors;
        if (colors > 256 || !ReadPalette(bytes, end, colors, entryBytes, dib)) {
            return false;
        }
    } else if (colors > 256) {
        return false;
    }
    dib.pixelOffset = end + colors * entryBytes;
    return true;
}

// Rows of whole pixels, in the order in which they lie.
void ReadIndexRow(const uint8_t* from, const Dib& dib, uint8_t* to) {
    const uint32_t perByte = 8 / dib.bits;
    const uint32_t mask = (1U << dib.bits) - 1;
    for (uint32_t x = 0; x < static_cast<uint32_t>(dib.width); ++x) {
        const uint32_t shift = (perByte - 1 - x % perByte) * dib.bits;
        std::memcpy(to + size_t{x} * 4, dib.palette[from[x / perByte] >> shift & mask].data(), 4);
    }
}

void ReadMaskedRow(const uint8_t* from, const Dib& dib, uint8_t opaque, uint8_t* to) {
    const CMaskedChannel red(dib.masks[0]);
    const CMaskedChannel green(dib.masks[1]);
    const CMaskedChannel blue(dib.masks[2]);
    const CMaskedChannel alpha(dib.masks[3]);
    const size_t step = dib.bits / 8;
    for (int32_t x = 0; x < dib.width; ++x, from += step, to += 4) {
        const uint32_t pixel = step == 2 ? Read16(from) : Read32(from);
        to[0] = blue.Of(pixel);
        to[1] = green.Of(pixel);
        to[2] = red.Of(pixel);
        to[3] = dib.masks[3] ? alpha.Of(pixel) : opaque;
    }
}

void ReadPackedRow(const uint8_t* from, const Dib& dib, bool keepFourth, uint8_t opaque,
                   uint8_t* to) {
    const size_t step = dib.bits / 8;
    for (int32_t x = 0; x < dib.width; ++x, from += step, to += 4) {
        to[0] = from[0];
        to[1] = from[1];
        to[2] = from[2];
        to[3] = keepFourth ? from[3] : opaque;
    }
}

bool ReadRows(ByteView bytes, const Dib& dib, bool isFile, uint8_t* pixels) {
    const size_t rowBytes = RowBytes(dib);
    const uint8_t opaque = isFile ? 0xFF : 0;
    for (int32_t y = 0; y < dib.height; ++y) {
        const uint8_t* from = bytes.data + dib.pixelOffset + rowBytes * y;
        const int32_t row = dib.isTopDown ? y : dib.height - 1 - y;
        uint8_t* to = pixels + size_t{4} * dib.width * row;
        if (dib.bits <= 8) {
            ReadIndexRow(from, dib, to);
        } else if (dib.packing != Packing::Rgb || dib.bits == 16) {
            ReadMaskedRow(from, dib, opaque, to);
        } else {
            ReadPackedRow(from, dib, dib.bits == 32 && !isFile, opaque, to);
        }
    }
    return true;
}

// Run lengths, bottom up: pairs of a count and a value, and after a count of 0 an escape: 0 ends
// the row, 1 the bitmap, 2 moves right and up, more is that many values as they are, padded to 16
// bits. What is skipped has the palette's first colour.
bool ReadRuns(ByteView bytes, const Dib& dib, uint8_t* pixels) {
    const size_t count = static_cast<size_t>(dib.width) * dib.height;
    for (size_t i = 0; i < count; ++i) {
        std::memcpy(pixels + i * 4, dib.palette[0].data(), 4);
    }
    const uint8_t* from = bytes.data + dib.pixelOffset;
    const uint8_t* const end = bytes.data + bytes.size;
    const bool isNibbles = dib.bits == 4;
    int64_t x = 0;
    int64_t y = 0; // from the bottom
    const auto Put = [&](uint32_t index) {
        uint8_t* row = pixels + size_t{4} * dib.width * (dib.height - 1 - y);
        std::memcpy(row + 4 * x++, dib.palette[index].data(), 4);
    };
    const auto Fits = [&](uint32_t run) { return y < dib.height && x + run <= dib.width; };
    while (end - from >= 2) {
        const uint32_t run = from[0];
        const uint32_t value = from[1];
        from += 2;
        if (run > 0) {
            if (!Fits(run)) {
                return false;
            }
            for (uint32_t i = 0; i < run; ++i) {
                Put(!isNibbles ? value : i % 2 == 0 ? value >> 4 : value & 15);
            }
        } else if (value == 0) {
            x = 0;
            ++y;
        } else if (value == 1) {
            return true;
        } else if (value == 2) {
            if (end - from < 2) {
                return false;
            }
            x += from[0];
            y += from[1];
            from += 2;
        } else {
            const uint32_t size = isNibbles ? (value + 1) / 2 : value;
            const uint32_t padded = (size + 1) / 2 * 2;
            if (end - from < static_cast<ptrdiff_t>(padded) || !Fits(value)) {
                return false;
            }
            for (uint32_t i = 0; i < value; ++i) {
                Put(!isNibbles ? from[i] : i % 2 == 0 ? from[i / 2] >> 4 : from[i / 2] & 15);
            }
            from += padded;
        }
    }
    return y >= dib.height; // the end mark may be missing, rows may not
}

bool Decode(ByteView bytes, Dib& dib, bool isFile, CPixelTarget& target) {
    if (isFile) {
        for (Pixel& color : dib.palette) {
            color[3] = 0xFF;
        }
    }
    const bool isRuns = dib.packing == Packing::Rle8 || dib.packing == Packing::Rle4;
    const size_t room = bytes.size - std::min(dib.pixelOffset, bytes.size);
    // Four bytes of run lengths can skip 255 x 255 pixels.
    const uint64_t size = isRuns ? static_cast<uint64_t>(dib.width) * dib.height
                                 : uint64_t{RowBytes(dib)} * dib.height;
    if (!IsPlausible(dib.width, dib.height, size, room, isRuns ? 255 * 255 / 4 : 1)) {
        return false;
    }
    uint8_t* const pixels = target.Create(dib.width, dib.height);
    return pixels && (isRuns ? ReadRuns(bytes, dib, pixels) : ReadRows(bytes, dib, isFile, pixels));
}

} // namespace

bool DecodeBmp(ByteView file, CPixelTarget& target) {
    if (file.size < kFileHeaderBytes || file.data[0] != 'B' || file.data[1] != 'M') {
        return false;
    }
    const ByteView bytes = {file.data + kFileHeaderBytes, file.size - kFileHeaderBytes};
    const uint32_t offset = Read32(file.data + 10);
    Dib dib = {};
    if (!ReadHeader(bytes, dib)) {
        return false;
    }
    if (offset >= kFileHeaderBytes) {
        dib.pixelOffset = offset - kFileHeaderBytes;
    }
    return Decode(bytes, dib, true, target);
}

bool DecodeDib(ByteView bytes, CPixelTarget& target) {
    Dib dib = {};
    return ReadHeader(bytes, dib) && Decode(bytes, dib, false, target);
}

bool EncodeBmp(const PixelRows& source, Bytes& file) {
    const uint64_t rowBytes = uint64_t{4} * static_cast<uint32_t>(source.width);
    const uint64_t pixelBytes = rowBytes * static_cast<uint32_t>(source.height);
    const uint64_t headerBytes = kFileHeaderBytes + kInfoHeaderBytes;
    if (headerBytes + pixelBytes > std::numeric_limits<uint32_t>::max()) {
        return false;
    }
    file.reserve(headerBytes + pixelBytes);
    Append16(file, 0x4D42); // "BM"
    Append32(file, static_cast<uint32_t>(headerBytes + pixelBytes));
    Append32(file, 0);
    Append32(file, static_cast<uint32_t>(headerBytes));
    Append32(file, kInfoHeaderBytes);
    Append32(file, static_cast<uint32_t>(source.width));
    Append32(file, static_cast<uint32_t>(source.height)); // bottom up
    Append16(file, 1);                                    // plane
    Append16(file, 32);
    Append32(file, static_cast<uint32_t>(Packing::Rgb));
    Append32(file, static_cast<uint32_t>(pixelBytes));
    Append32(file, 3780); // 96 pixels an inch, in pixels a metre
    Append32(file, 3780);
    Append32(file, 0); // no palette
    Append32(file, 0);
    for (int32_t y = source.height; y-- > 0;) {
        const uint8_t* row = source.pixels + ptrdiff_t{y} * source.pitch;
        file.insert(file.end(), row, row + rowBytes);
    }
    return true;
}

} // namespace kyv
