// JPEG through libjpeg-turbo.
#include <csetjmp>
#include <cstdio>
#include <cstdlib>
#include <limits>

#include <jpeglib.h>

#include <jerror.h>

#include "platform/posix/ImageCodecs.h"

namespace kyv {
namespace {

// A block of 64 pixels takes a bit at least.
constexpr uint32_t kBestCompression = 8 * 64;

// More scans than any encoder makes only serve to keep a reader busy.
constexpr int kMaxScans = 500;

struct ErrorManager {
    jpeg_error_mgr base;
    std::jmp_buf jump;
};

void Fail(j_common_ptr codec) {
    std::longjmp(reinterpret_cast<ErrorManager*>(codec->err)->jump, 1);
}

// The library mends damage with grey and a warning; we refuse it. Odd but whole files pass.
void Judge(j_common_ptr codec, int level) {
    if (level >= 0) {
        return;
    }
    switch (codec->err->msg_code) {
    case JWRN_ADOBE_XFORM:
    case JWRN_BOGUS_PROGRESSION:
    case JWRN_EXTRANEOUS_DATA:
    case JWRN_JFIF_MAJOR:
        return;
    default:
        Fail(codec);
    }
}

void CountScans(j_common_ptr codec) {
    if (codec->is_decompressor &&
        reinterpret_cast<j_decompress_ptr>(codec)->input_scan_number > kMaxScans) {
        Fail(codec);
    }
}

void Silence(j_common_ptr) {}

jpeg_error_mgr* Prepare(ErrorManager& error) {
    jpeg_std_error(&error.base);
    error.base.error_exit = Fail;
    error.base.emit_message = Judge;
    error.base.output_message = Silence;
    return &error.base;
}

// Inverted C, M, Y, K, as all programs store it, to B, G, R, A in place.
void ResolveCmyk(uint8_t* row, size_t width) {
    for (uint8_t* pixel = row; pixel != row + width * 4; pixel += 4) {
        const uint32_t black = pixel[3];
        const auto Mix = [&](uint32_t ink) {
            return static_cast<uint8_t>((ink * black + 127) / 255);
        };
        const uint8_t red = Mix(pixel[0]);
        pixel[0] = Mix(pixel[2]);
        pixel[1] = Mix(pixel[1]);
        pixel[2] = red;
        pixel[3] = 0xFF;
    }
}

// libjpeg leaves a function by longjmp, so the functions that call it hold no objects of their own.
class CJpegReader {
public:
    CJpegReader() { m_jpeg.err = Prepare(m_error); }
    ~CJpegReader() { jpeg_destroy_decompress(&m_jpeg); }

    CJpegReader(const CJpegReader&) = delete;
    CJpegReader& operator=(const CJpegReader&) = delete;

    bool Decode(ByteView file, CPixelTarget& target) {
        if (file.size > std::numeric_limits<unsigned long>::max() || setjmp(m_error.jump)) {
            return false;
        }
        jpeg_create_decompress(&m_jpeg);
        m_progress.progress_monitor = CountScans;
        m_jpeg.progress = &m_progress;
        jpeg_mem_src(&m_jpeg, file.data, file.size);
        jpeg_read_header(&m_jpeg, TRUE);
        const uint32_t width = m_jpeg.image_width;
        const uint32_t height = m_jpeg.image_height;
        // Arithmetic coding, which no common reader knows, has no best compression.
        if (m_jpeg.arith_code ||
            !IsPlausible(width, height, uint64_t{width} * height, file.size, kBestCompression)) {
            return false;
        }
        const bool isCmyk = m_jpeg.num_components == 4;
        m_jpeg.out_color_space = isCmyk ? JCS_CMYK : JCS_EXT_BGRA;
        jpeg_start_decompress(&m_jpeg);
        if (m_jpeg.output_components != 4 || m_jpeg.output_width != width ||
            m_jpeg.output_height != height) {
            return false;
        }
        uint8_t* const pixels =
            target.Create(static_cast<int32_t>(width), static_cast<int32_t>(height));
        if (!pixels) {
            return false;
        }
        while (m_jpeg.output_scanline < height) {
            uint8_t* row = pixels + size_t{width} * 4 * m_jpeg.output_scanline;
            jpeg_read_scanlines(&m_jpeg, &row, 1);
            if (isCmyk) {
                ResolveCmyk(row, width);
            }
        }
        jpeg_finish_decompress(&m_jpeg);
        return true;
    }

private:
    jpeg_decompress_struct m_jpeg = {};
    ErrorManager m_error = {};
    jpeg_progress_mgr m_progress = {};
};

class CJpegWriter {
public:
    CJpegWriter() { m_jpeg.err = Prepare(m_error); }
    ~CJpegWriter() {
        jpeg_destroy_compress(&m_jpeg);
        std::free(m_pFile);
    }

    CJpegWriter(const CJpegWriter&) = delete;
    CJpegWriter& operator=(const CJpegWriter&) = delete;

    bool Encode(const PixelRows& source, int quality) {
        if (setjmp(m_error.jump)) {
            return false;
        }
        jpeg_create_compress(&m_jpeg);
        jpeg_mem_dest(&m_jpeg, &m_pFile, &m_nBytes);
        m_jpeg.image_width = static_cast<JDIMENSION>(source.width);
        m_jpeg.image_height = static_cast<JDIMENSION>(source.height);
        m_jpeg.input_components = 4;
        m_jpeg.in_color_space = JCS_EXT_BGRX;
        jpeg_set_defaults(&m_jpeg);
        jpeg_set_quality(&m_jpeg, quality, TRUE);
        jpeg_start_compress(&m_jpeg, TRUE);
        while (m_jpeg.next_scanline < m_jpeg.image_height) {
            auto* row = const_cast<uint8_t*>(source.pixels +
                                             ptrdiff_t{m_jpeg.next_scanline} * source.pitch);
            jpeg_write_scanlines(&m_jpeg, &row, 1);
        }
        jpeg_finish_compress(&m_jpeg);
        return true;
    }

    ByteView File() const { return {m_pFile, m_nBytes}; }

private:
    jpeg_compress_struct m_jpeg = {};
    ErrorManager m_error = {};
    unsigned char* m_pFile = nullptr;
    unsigned long m_nBytes = 0;
};

} // namespace

bool DecodeJpeg(ByteView file, CPixelTarget& target) {
    return CJpegReader().Decode(file, target);
}

bool EncodeJpeg(const PixelRows& source, int quality, Bytes& file) {
    CJpegWriter writer;
    if (!writer.Encode(source, quality)) {
        return false;
    }
    file.assign(writer.File().data, writer.File().data + writer.File().size);
    return true;
}

} // namespace kyv
