// TIFF through libtiff. Of a file with several pages the first counts.
#include <algorithm>
#include <cstring>
#include <limits>
#include <memory>

#include <fcntl.h>
#include <tiffio.h>

#include "platform/posix/ImageCodecs.h"

namespace kyv {
namespace {

// Reads from one block of memory or writes to another; never both.
struct MemoryFile {
    ByteView input;
    Bytes* output;
    uint64_t offset;
};

tmsize_t Read(thandle_t handle, void* bytes, tmsize_t count) {
    auto& file = *static_cast<MemoryFile*>(handle);
    if (file.offset >= file.input.size || count <= 0) {
        return 0;
    }
    const size_t size = std::min<size_t>(static_cast<size_t>(count), file.input.size - file.offset);
    std::memcpy(bytes, file.input.data + file.offset, size);
    file.offset += size;
    return static_cast<tmsize_t>(size);
}

tmsize_t Write(thandle_t handle, void* bytes, tmsize_t count) {
    auto& file = *static_cast<MemoryFile*>(handle);
    if (!file.output || count < 0) {
        return -1;
    }
    try {
        const size_t end = file.offset + static_cast<size_t>(count);
        file.output->resize(std::max(file.output->size(), end));
        std::memcpy(file.output->data() + file.offset, bytes, static_cast<size_t>(count));
        file.offset = end;
        return count;
    } catch (...) {
        return -1;
    }
}

toff_t Size(thandle_t handle) {
    const auto& file = *static_cast<MemoryFile*>(handle);
    return file.output ? file.output->size() : file.input.size;
}

toff_t Seek(thandle_t handle, toff_t offset, int whence) {
    auto& file = *static_cast<MemoryFile*>(handle);
    const uint64_t base = whence == SEEK_SET ? 0 : whence == SEEK_CUR ? file.offset : Size(handle);
    file.offset = base + offset;
    return file.offset;
}

int Close(thandle_t) {
    return 0;
}

// Handled here: the library would print it.
int Silence(TIFF*, void*, const char*, const char*, va_list) {
    return 1;
}

struct CloseTiff {
    // Closing would write what was begun and not flushed; where memory ran out that is not whole.
    void operator()(TIFF* tiff) const {
        TIFFSetMode(tiff, O_RDONLY);
        TIFFClose(tiff);
    }
};
using TiffPointer = std::unique_ptr<TIFF, CloseTiff>;

// Error handlers of this file alone: the process's are the host's.
TiffPointer Open(MemoryFile& file, const char* mode) {
    TIFFOpenOptions* const options = TIFFOpenOptionsAlloc();
    if (!options) {
        return nullptr;
    }
    TIFFOpenOptionsSetMaxSingleMemAlloc(options, std::numeric_limits<int32_t>::max());
    TIFFOpenOptionsSetErrorHandlerExtR(options, Silence, nullptr);
    TIFFOpenOptionsSetWarningHandlerExtR(options, Silence, nullptr);
    TiffPointer tiff(TIFFClientOpenExt("", mode, &file, Read, Write, Seek, Close, Size, nullptr,
                                       nullptr, options));
    TIFFOpenOptionsFree(options);
    return tiff;
}

// To how many bytes one byte of the file unfolds at best; 0 for the compressions that the system's
// decoder of the other target does not know either.
uint32_t BestCompression(uint16_t compression) {
    switch (compression) {
    case COMPRESSION_NONE:
        return 1;
    case COMPRESSION_PACKBITS:
        return 64;
    case COMPRESSION_LZW:
        return 4096;
    case COMPRESSION_ADOBE_DEFLATE:
    case COMPRESSION_DEFLATE:
        return 1032;
    case COMPRESSION_JPEG:
        return 3 * 8 * 64;
    case COMPRESSION_CCITTRLE:
    case COMPRESSION_CCITTFAX3:
    case COMPRESSION_CCITTFAX4:
        return 8 * 1024; // a row a bit, in rows of up to 65536 pixels
    default:
        return 0;
    }
}

enum class Alpha { None, Straight, Premultiplied };

// Pixels of whole 8- or 16-bit samples, with samples beyond the colours.
struct SampleLayout {
    int32_t width;
    int32_t height;
    uint16_t samples;
    uint16_t colors; // 1 grey, 3 red, green, blue
    bool isWide;     // 16 bits
    bool isInverted; // grey with 0 for white
    bool isSeparate; // a plane a sample
    Alpha alpha;
};

// Where in B, G, R, A a sample goes: grey to all three colours.
void PutSamples(uint8_t* pixels, const SampleLayout& layout, uint16_t sample, const uint8_t* source,
                size_t stride, int32_t count) {
    const bool isAlpha = sample == layout.colors;
    const uint8_t flip = layout.isInverted && !isAlpha ? 0xFF : 0;
    uint8_t* to = pixels + (isAlpha ? 3 : layout.colors == 3 ? 2 - sample : 0);
    for (int32_t i = 0; i < count; ++i, source += stride, to += 4) {
        uint8_t value = *source;
        if (layout.isWide) {
            uint16_t wide;
            std::memcpy(&wide, source, sizeof wide);
            value = NarrowSample(wide);
        }
        value ^= flip;
        *to = value;
        if (layout.colors == 1 && !isAlpha) {
            to[1] = to[2] = value;
        }
    }
}

// One run of decoded samples: all samples of its pixels, or one plane's.
void PutRun(uint8_t* pixels, const SampleLayout& layout, uint16_t plane, const uint8_t* source,
            int32_t count) {
    const size_t bytes = layout.isWide ? 2 : 1;
    if (layout.isSeparate) {
        PutSamples(pixels, layout, plane, source, bytes, count);
        return;
    }
    const uint16_t used = layout.colors + (layout.alpha != Alpha::None ? 1 : 0);
    for (uint16_t sample = 0; sample < used; ++sample) {
        PutSamples(pixels, layout, sample, source + sample * bytes, layout.samples * bytes, count);
    }
}

bool ReadRows(TIFF* tiff, const SampleLayout& layout, uint16_t plane, uint8_t* pixels) {
    const auto rowBytes = static_cast<size_t>(TIFFScanlineSize64(tiff));
    const std::unique_ptr<uint8_t[]> row(new uint8_t[rowBytes]);
    for (int32_t y = 0; y < layout.height; ++y) {
        if (TIFFReadScanline(tiff, row.get(), static_cast<uint32_t>(y), plane) != 1) {
            return false;
        }
        PutRun(pixels + size_t{4} * layout.width * y, layout, plane, row.get(), layout.width);
    }
    return true;
}

bool ReadTiles(TIFF* tiff, const SampleLayout& layout, uint16_t plane, uint8_t* pixels,
               size_t fileBytes, uint32_t bestCompression) {
    uint32_t tileWidth = 0;
    uint32_t tileHeight = 0;
    TIFFGetField(tiff, TIFFTAG_TILEWIDTH, &tileWidth);
    TIFFGetField(tiff, TIFFTAG_TILELENGTH, &tileHeight);
    const uint64_t tileBytes = TIFFTileSize64(tiff);
    const uint64_t tileRowBytes = TIFFTileRowSize64(tiff);
    if (!IsPlausible(tileWidth, tileHeight, tileBytes, fileBytes, bestCompression) ||
        tileRowBytes == 0) {
        return false;
    }
    const std::unique_ptr<uint8_t[]> tile(new uint8_t[tileBytes]);
    const auto stepX = static_cast<int32_t>(tileWidth);
    const auto stepY = static_cast<int32_t>(tileHeight);
    for (int64_t top = 0; top < layout.height; top += stepY) {
        for (int64_t left = 0; left < layout.width; left += stepX) {
            if (TIFFReadTile(tiff, tile.get(), static_cast<uint32_t>(left),
                             static_cast<uint32_t>(top), 0, plane) < 0) {
                return false;
            }
            const auto count = static_cast<int32_t>(std::min<int64_t>(stepX, layout.width - left));
            const int64_t bottom = std::min<int64_t>(top + stepY, layout.height);
            for (int64_t y = top; y < bottom; ++y) {
                PutRun(pixels + 4 * (layout.width * y + left), layout, plane,
                       tile.get() + static_cast<uint64_t>(y - top) * tileRowBytes, count);
            }
        }
    }
    return true;
}

void DividePremultiplied(uint8_t* pixels, size_t count) {
    for (uint8_t* pixel = pixels; pixel != pixels + count * 4; pixel += 4) {
        const uint32_t alpha = pixel[3];
        for (int c = 0; c < 3 && alpha != 0; ++c) {
            pixel[c] = static_cast<uint8_t>(std::min(255U, (pixel[c] * 255 + alpha / 2) / alpha));
        }
    }
}

// The library's ready-made reader multiplies colours by alpha, so pixels with extra samples are
// read sample by sample.
bool FindSampleLayout(TIFF* tiff, SampleLayout& layout) {
    uint16_t photometric = 0;
    uint16_t bits = 1;
    uint16_t format = SAMPLEFORMAT_UINT;
    uint16_t planar = PLANARCONFIG_CONTIG;
    uint16_t extraCount = 0;
    const uint16_t* extra = nullptr;
    TIFFGetField(tiff, TIFFTAG_PHOTOMETRIC, &photometric);
    TIFFGetFieldDefaulted(tiff, TIFFTAG_SAMPLESPERPIXEL, &layout.samples);
    TIFFGetFieldDefaulted(tiff, TIFFTAG_BITSPERSAMPLE, &bits);
    TIFFGetFieldDefaulted(tiff, TIFFTAG_SAMPLEFORMAT, &format);
    TIFFGetFieldDefaulted(tiff, TIFFTAG_PLANARCONFIG, &planar);
    TIFFGetFieldDefaulted(tiff, TIFFTAG_EXTRASAMPLES, &extraCount, &extra);
    layout.colors = photometric == PHOTOMETRIC_RGB ? 3 : 1;
    layout.isWide = bits == 16;
    layout.isInverted = photometric == PHOTOMETRIC_MINISWHITE;
    layout.isSeparate = planar == PLANARCONFIG_SEPARATE;
    layout.alpha = Alpha::None;
    if (extraCount > 0 && extra && extra[0] == EXTRASAMPLE_UNASSALPHA) {
        layout.alpha = Alpha::Straight;
    } else if (extraCount > 0 && extra && extra[0] == EXTRASAMPLE_ASSOCALPHA) {
        layout.alpha = Alpha::Premultiplied;
    }
    const bool isKnown = photometric == PHOTOMETRIC_RGB || photometric == PHOTOMETRIC_MINISBLACK ||
                         photometric == PHOTOMETRIC_MINISWHITE;
    return isKnown && (bits == 8 || bits == 16) && format == SAMPLEFORMAT_UINT &&
           layout.samples > layout.colors;
}

bool ReadSamples(TIFF* tiff, const SampleLayout& layout, uint8_t* pixels, size_t fileBytes,
                 uint32_t bestCompression) {
    const size_t count = static_cast<size_t>(layout.width) * layout.height;
    std::memset(pixels, 0xFF, count * 4);
    const uint16_t used = layout.colors + (layout.alpha != Alpha::None ? 1 : 0);
    const uint16_t planes = layout.isSeparate ? used : 1;
    for (uint16_t plane = 0; plane < planes; ++plane) {
        const bool whole = TIFFIsTiled(tiff)
                               ? ReadTiles(tiff, layout, plane, pixels, fileBytes, bestCompression)
                               : ReadRows(tiff, layout, plane, pixels);
        if (!whole) {
            return false;
        }
    }
    if (layout.alpha == Alpha::Premultiplied) {
        DividePremultiplied(pixels, count);
    }
    return true;
}

// Every other kind: palettes, faxes, YCbCr, CMYK. None has alpha.
bool ReadReadyMade(TIFF* tiff, uint8_t* pixels, uint32_t width, uint32_t height) {
    char message[1024];
    TIFFRGBAImage image;
    if (!TIFFRGBAImageBegin(&image, tiff, 1, message)) {
        return false;
    }
    image.req_orientation = image.orientation; // rows in file order, whatever the tag says
    const int whole = TIFFRGBAImageGet(&image, reinterpret_cast<uint32_t*>(pixels), width, height);
    TIFFRGBAImageEnd(&image);
    for (uint8_t* pixel = pixels; pixel != pixels + size_t{4} * width * height; pixel += 4) {
        std::swap(pixel[0], pixel[2]);
        pixel[3] = 0xFF;
    }
    return whole != 0;
}

bool WritePicture(TIFF* out, const PixelRows& source) {
    const uint16_t extra[] = {EXTRASAMPLE_UNASSALPHA};
    if (!TIFFSetField(out, TIFFTAG_IMAGEWIDTH, source.width) ||
        !TIFFSetField(out, TIFFTAG_IMAGELENGTH, source.height) ||
        !TIFFSetField(out, TIFFTAG_SAMPLESPERPIXEL, 4) ||
        !TIFFSetField(out, TIFFTAG_BITSPERSAMPLE, 8) ||
        !TIFFSetField(out, TIFFTAG_EXTRASAMPLES, 1, extra) ||
        !TIFFSetField(out, TIFFTAG_PHOTOMETRIC, PHOTOMETRIC_RGB) ||
        !TIFFSetField(out, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG) ||
        !TIFFSetField(out, TIFFTAG_COMPRESSION, COMPRESSION_LZW) ||
        !TIFFSetField(out, TIFFTAG_ROWSPERSTRIP, TIFFDefaultStripSize(out, 0))) {
        return false; // some of them need memory
    }
    // This one does not say so when it finds none.
    uint16_t extras = 0;
    const uint16_t* kinds = nullptr;
    if (TIFFGetField(out, TIFFTAG_EXTRASAMPLES, &extras, &kinds) != 1 || extras != 1 || !kinds) {
        return false;
    }
    Bytes row(static_cast<size_t>(source.width) * 4);
    for (int32_t y = 0; y < source.height; ++y) {
        const uint8_t* from = source.pixels + ptrdiff_t{y} * source.pitch;
        for (size_t i = 0; i < row.size(); i += 4) {
            row[i] = from[i + 2];
            row[i + 1] = from[i + 1];
            row[i + 2] = from[i];
            row[i + 3] = from[i + 3];
        }
        if (TIFFWriteScanline(out, row.data(), static_cast<uint32_t>(y)) != 1) {
            return false;
        }
    }
    return TIFFFlush(out) == 1;
}

} // namespace

bool DecodeTiff(ByteView file, CPixelTarget& target) {
    MemoryFile memory = {file, nullptr, 0};
    const TiffPointer tiff = Open(memory, "r");
    if (!tiff) {
        return false;
    }
    uint32_t width = 0;
    uint32_t height = 0;
    uint16_t compression = COMPRESSION_NONE;
    TIFFGetField(tiff.get(), TIFFTAG_IMAGEWIDTH, &width);
    TIFFGetField(tiff.get(), TIFFTAG_IMAGELENGTH, &height);
    TIFFGetFieldDefaulted(tiff.get(), TIFFTAG_COMPRESSION, &compression);
    const uint32_t best = BestCompression(compression);
    const uint64_t rowBytes = TIFFScanlineSize64(tiff.get());
    if (best == 0 || rowBytes == 0 || !IsPlausible(width, height, 0, 1, 1) ||
        rowBytes > std::numeric_limits<int32_t>::max() ||
        !IsPlausible(width, height, rowBytes * height, file.size, best)) {
        return false;
    }
    SampleLayout layout = {};
    layout.width = static_cast<int32_t>(width);
    layout.height = static_cast<int32_t>(height);
    const bool hasExtra = FindSampleLayout(tiff.get(), layout);
    uint8_t* const pixels = target.Create(layout.width, layout.height);
    if (!pixels) {
        return false;
    }
    return hasExtra ? ReadSamples(tiff.get(), layout, pixels, file.size, best)
                    : ReadReadyMade(tiff.get(), pixels, width, height);
}

bool EncodeTiff(const PixelRows& source, Bytes& file) {
    MemoryFile memory = {{}, &file, 0};
    const TiffPointer tiff = Open(memory, "w");
    return tiff && WritePicture(tiff.get(), source);
}

} // namespace kyv
