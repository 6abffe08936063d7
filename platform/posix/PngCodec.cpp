// PNG through libpng.
#include <csetjmp>

#include <png.h>

#include "platform/posix/ImageCodecs.h"

namespace kyv {
namespace {

// The library's limit of a million pixels a side is not ours.
constexpr uint32_t kMaxSide = PNG_UINT_31_MAX;

// Deflate unfolds a byte to at most 1032.
constexpr uint32_t kBestCompression = 1032;

void Fail(png_structp png, png_const_charp) {
    png_longjmp(png, 1);
}

void Ignore(png_structp, png_const_charp) {}

// libpng leaves a function by longjmp, so the functions that call it hold no objects of their own.
class CPngReader {
public:
    explicit CPngReader(ByteView file) : m_file(file) {
        m_pPng = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, Fail, Ignore);
        m_pInfo = m_pPng ? png_create_info_struct(m_pPng) : nullptr;
    }
    ~CPngReader() { png_destroy_read_struct(&m_pPng, &m_pInfo, nullptr); }

    CPngReader(const CPngReader&) = delete;
    CPngReader& operator=(const CPngReader&) = delete;

    bool Decode(CPixelTarget& target) {
        if (!m_pInfo || setjmp(png_jmpbuf(m_pPng))) {
            return false;
        }
        png_set_user_limits(m_pPng, kMaxSide, kMaxSide);
        png_set_read_fn(m_pPng, this, Read);
        png_read_info(m_pPng, m_pInfo);
        const uint32_t width = png_get_image_width(m_pPng, m_pInfo);
        const uint32_t height = png_get_image_height(m_pPng, m_pInfo);
        if (!IsPlausible(width, height, uint64_t{png_get_rowbytes(m_pPng, m_pInfo)} * height,
                         m_file.size, kBestCompression)) {
            return false;
        }
        const int passes = RequestBgra();
        if (png_get_rowbytes(m_pPng, m_pInfo) != size_t{width} * 4) {
            return false;
        }
        uint8_t* const pixels =
            target.Create(static_cast<int32_t>(width), static_cast<int32_t>(height));
        if (!pixels) {
            return false;
        }
        for (int pass = 0; pass < passes; ++pass) {
            for (uint32_t y = 0; y < height; ++y) {
                png_read_row(m_pPng, pixels + size_t{width} * 4 * y, nullptr);
            }
        }
        png_read_end(m_pPng, nullptr);
        return true;
    }

private:
    static void Read(png_structp png, png_bytep bytes, size_t count) {
        auto& self = *static_cast<CPngReader*>(png_get_io_ptr(png));
        if (count > self.m_file.size - self.m_nOffset) {
            png_error(png, "cut off");
        }
        for (size_t i = 0; i < count; ++i) {
            bytes[i] = self.m_file.data[self.m_nOffset + i];
        }
        self.m_nOffset += count;
    }

    // Any kind of pixel to B, G, R, A of 8 bits. Values are taken as they are; no gamma is applied.
    int RequestBgra() {
        const bool hasAlpha = (png_get_color_type(m_pPng, m_pInfo) & PNG_COLOR_MASK_ALPHA) != 0 ||
                              png_get_valid(m_pPng, m_pInfo, PNG_INFO_tRNS) != 0;
        png_set_expand(m_pPng);
        png_set_scale_16(m_pPng);
        png_set_gray_to_rgb(m_pPng);
        png_set_bgr(m_pPng);
        if (!hasAlpha) {
            png_set_add_alpha(m_pPng, 0xFF, PNG_FILLER_AFTER);
        }
        const int passes = png_set_interlace_handling(m_pPng);
        png_read_update_info(m_pPng, m_pInfo);
        return passes;
    }

    ByteView m_file;
    size_t m_nOffset = 0;
    png_structp m_pPng = nullptr;
    png_infop m_pInfo = nullptr;
};

class CPngWriter {
public:
    explicit CPngWriter(Bytes& file) : m_file(file) {
        m_pPng = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, Fail, Ignore);
        m_pInfo = m_pPng ? png_create_info_struct(m_pPng) : nullptr;
    }
    ~CPngWriter() { png_destroy_write_struct(&m_pPng, &m_pInfo); }

    CPngWriter(const CPngWriter&) = delete;
    CPngWriter& operator=(const CPngWriter&) = delete;

    bool Encode(const PixelRows& source) {
        if (!m_pInfo || setjmp(png_jmpbuf(m_pPng))) {
            return false;
        }
        png_set_user_limits(m_pPng, kMaxSide, kMaxSide);
        png_set_write_fn(m_pPng, this, Write, nullptr);
        png_set_IHDR(m_pPng, m_pInfo, static_cast<uint32_t>(source.width),
                     static_cast<uint32_t>(source.height), 8, PNG_COLOR_TYPE_RGB_ALPHA,
                     PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
        png_write_info(m_pPng, m_pInfo);
        png_set_bgr(m_pPng);
        for (int32_t y = 0; y < source.height; ++y) {
            png_write_row(m_pPng, source.pixels + ptrdiff_t{y} * source.pitch);
        }
        png_write_end(m_pPng, nullptr);
        return true;
    }

private:
    static void Write(png_structp png, png_bytep bytes, size_t count) {
        auto& self = *static_cast<CPngWriter*>(png_get_io_ptr(png));
        if (!Append(self.m_file, bytes, count)) {
            png_error(png, "out of memory");
        }
    }

    static bool Append(Bytes& file, const uint8_t* bytes, size_t count) {
        try {
            file.insert(file.end(), bytes, bytes + count);
            return true;
        } catch (...) {
            return false;
        }
    }

    Bytes& m_file;
    png_structp m_pPng = nullptr;
    png_infop m_pInfo = nullptr;
};

} // namespace

bool DecodePng(ByteView file, CPixelTarget& target) {
    return CPngReader(file).Decode(target);
}

bool EncodePng(const PixelRows& source, Bytes& file) {
    return CPngWriter(file).Encode(source);
}

} // namespace kyv
