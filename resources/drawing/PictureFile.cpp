// Writes pictures as PNG and bitmap files.
#include "resources/drawing/PictureFile.h"

#include <cstdio>
#include <fstream>
#include <memory>
#include <stdexcept>

#include <png.h>

namespace kyvdraw {
namespace {

void WritePng(const std::string& path, int width, int height, int channels,
              const std::vector<uint8_t>& bytes) {
    struct Close {
        void operator()(FILE* file) const { std::fclose(file); }
    };
    const std::unique_ptr<FILE, Close> file(std::fopen(path.c_str(), "wb"));
    if (!file) {
        throw std::runtime_error("cannot write " + path);
    }
    png_structp png = png_create_write_struct(
        PNG_LIBPNG_VER_STRING, nullptr,
        [](png_structp, png_const_charp text) { throw std::runtime_error(text); }, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_set_IHDR(png, info, static_cast<png_uint_32>(width), static_cast<png_uint_32>(height), 8,
                 channels == 4 ? PNG_COLOR_TYPE_RGBA : PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    png_set_compression_level(png, 9);
    png_write_info(png, info);
    for (int y = 0; y < height; ++y) {
        png_write_row(png, bytes.data() + static_cast<size_t>(y) * static_cast<size_t>(width) *
                                              static_cast<size_t>(channels));
    }
    png_write_end(png, info);
    png_destroy_write_struct(&png, &info);
}

// Little-endian fields of a bitmap file.
struct BmpBytes {
    std::vector<uint8_t> bytes;
    void Put16(uint32_t v) {
        bytes.push_back(static_cast<uint8_t>(v));
        bytes.push_back(static_cast<uint8_t>(v >> 8));
    }
    void Put32(uint32_t v) {
        Put16(v & 0xFFFF);
        Put16(v >> 16);
    }
};

// The file header and BITMAPINFOHEADER, to be followed by the palette and the rows.
BmpBytes BmpHeader(int width, int height, uint32_t bits, size_t colours) {
    constexpr uint32_t kHeaders = 14 + 40;
    const uint32_t pitch = (static_cast<uint32_t>(width) * bits / 8 + 3) / 4 * 4;
    const uint32_t image = pitch * static_cast<uint32_t>(height);
    const uint32_t offset = kHeaders + static_cast<uint32_t>(colours) * 4;
    BmpBytes out;
    out.Put16(0x4D42);
    out.Put32(offset + image);
    out.Put32(0);
    out.Put32(offset);
    out.Put32(40);
    out.Put32(static_cast<uint32_t>(width));
    out.Put32(static_cast<uint32_t>(height));
    out.Put16(1);
    out.Put16(bits);
    out.Put32(0); // uncompressed
    out.Put32(image);
    out.Put32(2835); // 72 pixels an inch
    out.Put32(2835);
    out.Put32(static_cast<uint32_t>(colours));
    out.Put32(0);
    return out;
}

void WriteFile(const std::string& path, const std::vector<uint8_t>& bytes) {
    std::ofstream file(path, std::ios::binary);
    file.write(reinterpret_cast<const char*>(bytes.data()),
               static_cast<std::streamsize>(bytes.size()));
    if (!file.flush()) {
        throw std::runtime_error("cannot write " + path);
    }
}

} // namespace

void WritePng(const std::string& path, const CCanvas& canvas) {
    std::vector<uint8_t> bytes;
    bytes.reserve(static_cast<size_t>(canvas.Width()) * static_cast<size_t>(canvas.Height()) * 3);
    for (int y = 0; y < canvas.Height(); ++y) {
        for (int x = 0; x < canvas.Width(); ++x) {
            const Colour c = canvas.At(x, y);
            for (const float channel : {c.r, c.g, c.b}) {
                bytes.push_back(static_cast<uint8_t>(ToEncoded(channel) * 255 + 0.5f));
            }
        }
    }
    WritePng(path, canvas.Width(), canvas.Height(), 3, bytes);
}

void WritePng(const std::string& path, const Sprite& sprite) {
    WritePng(path, sprite.width, sprite.height, 4, sprite.bytes);
}

void WriteBmp32(const std::string& path, const Sprite& sprite) {
    BmpBytes out = BmpHeader(sprite.width, sprite.height, 32, 0);
    for (int y = sprite.height - 1; y >= 0; --y) {
        for (int x = 0; x < sprite.width; ++x) {
            const uint8_t* rgba = &sprite.bytes[static_cast<size_t>(y * sprite.width + x) * 4];
            out.bytes.insert(out.bytes.end(), {rgba[2], rgba[1], rgba[0], rgba[3]});
        }
    }
    WriteFile(path, out.bytes);
}

void WriteBmp8(const std::string& path, int width, int height, const std::vector<uint8_t>& indices,
               const std::vector<uint8_t>& greys) {
    BmpBytes out = BmpHeader(width, height, 8, greys.size());
    for (const uint8_t grey : greys) {
        out.Put32(static_cast<uint32_t>(grey) * 0x010101);
    }
    for (int y = height - 1; y >= 0; --y) {
        const auto row = indices.begin() + static_cast<ptrdiff_t>(y) * width;
        out.bytes.insert(out.bytes.end(), row, row + width);
        out.bytes.resize((out.bytes.size() - 54 - greys.size() * 4 + 3) / 4 * 4 + 54 +
                         greys.size() * 4);
    }
    WriteFile(path, out.bytes);
}

} // namespace kyvdraw
