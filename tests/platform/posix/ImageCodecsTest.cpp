// The kinds of pictures that the Linux decoders take beyond those that we write, and damage of
// every sort.
#include <algorithm>
#include <array>
#include <cstring>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include <png.h>
#include <tiffio.h>

#include "platform/posix/ImageCodecs.h"
#include "tests/support/PictureFiles.h"

namespace {

using namespace kyv;

// Room for a picture, and how often it was asked for.
class CPixels final : public CPixelTarget {
public:
    uint8_t* Create(int32_t w, int32_t h) noexcept override {
        width = w;
        height = h;
        pixels.assign(size_t{4} * static_cast<size_t>(w) * static_cast<size_t>(h), 0xCD);
        return pixels.data();
    }

    int32_t width = 0;
    int32_t height = 0;
    Bytes pixels;
};

ByteView View(const Bytes& bytes) {
    return {bytes.data(), bytes.size()};
}

// The pixels, or nothing when the picture is refused.
Bytes Decoded(const Bytes& file) {
    CPixels target;
    return DecodeImage(View(file), target) ? target.pixels : Bytes();
}

void Append(Bytes& file, uint32_t value, int count) {
    for (int i = 0; i < count; ++i, value >>= 8) {
        file.push_back(static_cast<uint8_t>(value));
    }
}

Bytes Joined(Bytes first, const Bytes& second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

struct BmpParts {
    int32_t width;
    int32_t height;
    uint32_t bits;
    uint32_t packing;
    Bytes table; // masks and palette
    Bytes rows;
    uint32_t colors = 0;
};

// A bitmap as resources hold it: without the file's header.
Bytes Dib(const BmpParts& parts) {
    Bytes dib;
    Append(dib, 40, 4);
    Append(dib, static_cast<uint32_t>(parts.width), 4);
    Append(dib, static_cast<uint32_t>(parts.height), 4);
    Append(dib, 1, 2);
    Append(dib, parts.bits, 2);
    Append(dib, parts.packing, 4);
    Append(dib, 0, 4);
    Append(dib, 0, 4);
    Append(dib, 0, 4);
    Append(dib, parts.colors, 4);
    Append(dib, 0, 4);
    return Joined(Joined(dib, parts.table), parts.rows);
}

Bytes Bmp(const BmpParts& parts) {
    const Bytes dib = Dib(parts);
    Bytes file = {'B', 'M'};
    Append(file, static_cast<uint32_t>(14 + dib.size()), 4);
    Append(file, 0, 4);
    Append(file, static_cast<uint32_t>(54 + parts.table.size()), 4);
    return Joined(file, dib);
}

const Bytes kTwoColors = {1, 2, 3, 9, 4, 5, 6, 9};
const Bytes kFourColors = {1, 2, 3, 0, 4, 5, 6, 0, 7, 8, 9, 0, 10, 11, 12, 0};

struct BmpCase {
    const char* name;
    BmpParts parts;
    Bytes expected; // of the file, opaque; rows top down
};

TEST(BmpDecoder, ReadsEveryPacking) {
    const BmpCase cases[] = {
        {"1 bit, rows of 4 bytes, bottom up",
         {2, 2, 1, 0, kTwoColors, {0x40, 0, 0, 0, 0x80, 0, 0, 0}},
         {4, 5, 6, 255, 1, 2, 3, 255, 1, 2, 3, 255, 4, 5, 6, 255}},
        {"4 bits, high half first, palette of 4",
         {3, 1, 4, 0, kFourColors, {0x12, 0x30, 0, 0}, 4},
         {4, 5, 6, 255, 7, 8, 9, 255, 10, 11, 12, 255}},
        {"24 bits, top down",
         {1, -2, 24, 0, {}, {1, 2, 3, 0, 4, 5, 6, 0}},
         {1, 2, 3, 255, 4, 5, 6, 255}},
        {"32 bits without alpha", {1, 1, 32, 0, {}, {1, 2, 3, 77}}, {1, 2, 3, 255}},
        // 0x7FE0: red 31, green 31, blue 0; 0x0011: blue 17, whose bits repeat to 10001100.
        {"16 bits of 5",
         {2, 1, 16, 0, {}, {0xE0, 0x7F, 0x11, 0x00}},
         {0, 255, 255, 255, 0x8C, 0, 0, 255}},
        // Masks R, G, B: 0xF800, 0x07E0, 0x001F. 0x0400 is green 32 of 63: 10000010.
        {"16 bits of 5, 6, 5",
         {2, 1, 16, 3, {0, 0xF8, 0, 0, 0xE0, 7, 0, 0, 0x1F, 0, 0, 0}, {0, 4, 0, 0xF8}},
         {0, 0x82, 0, 255, 0, 0, 255, 255}},
        // Masks in the order R, G, B of the bytes 0, 1, 2; the alpha mask is the fourth byte.
        {"32 bits with masks and alpha",
         {1, 1, 32, 6, {255, 0, 0, 0, 0, 255, 0, 0, 0, 0, 255, 0, 0, 0, 0, 255}, {1, 2, 3, 4}},
         {3, 2, 1, 4}},
        // Two of colour 1 and the rest of the row left out; then three values as they are.
        {"run lengths of 8 bits",
         {3, 2, 8, 1, kFourColors, {2, 1, 0, 0, 0, 3, 1, 2, 3, 0, 0, 1}, 4},
         {4, 5, 6, 255, 7, 8, 9, 255, 10, 11, 12, 255, //
          4, 5, 6, 255, 4, 5, 6, 255, 1,  2,  3,  255}},
        {"run lengths of 8 bits with a skip",
         {3, 1, 8, 1, kFourColors, {0, 2, 2, 0, 1, 3}, 4},
         {}}, // no end mark, and the row not ended
        {"run lengths of 4 bits",
         {5, 1, 4, 2, kFourColors, {3, 0x12, 0, 2, 1, 0, 1, 0x30, 0, 1}, 4},
         {4, 5, 6, 255, 7, 8, 9, 255, 4, 5, 6, 255, 1, 2, 3, 255, 10, 11, 12, 255}},
    };
    for (const BmpCase& entry : cases) {
        EXPECT_EQ(Decoded(Bmp(entry.parts)), entry.expected) << entry.name;
    }
}

TEST(BmpDecoder, ReadsTheOldestHeader) {
    Bytes file = {'B', 'M', 0, 0, 0, 0, 0, 0, 0, 0, 32, 0, 0, 0};
    Append(file, 12, 4);
    Append(file, 2, 2); // width, height
    Append(file, 1, 2);
    Append(file, 1, 2);
    Append(file, 1, 2); // 1 bit; the palette has 3 bytes a colour
    file = Joined(file, {1, 2, 3, 4, 5, 6, 0x40, 0, 0, 0});
    EXPECT_EQ(Decoded(file), (Bytes{1, 2, 3, 255, 4, 5, 6, 255}));
}

TEST(BmpDecoder, BitmapResourcesHaveNoAlphaButTheirOwn) {
    const auto decoded = [](const BmpParts& parts) {
        CPixels target;
        return DecodeDib(View(Dib(parts)), target) ? target.pixels : Bytes();
    };
    EXPECT_EQ(decoded({2, 1, 1, 0, kTwoColors, {0x40, 0, 0, 0}}), (Bytes{1, 2, 3, 0, 4, 5, 6, 0}));
    EXPECT_EQ(decoded({1, 1, 24, 0, {}, {1, 2, 3, 0}}), (Bytes{1, 2, 3, 0}));
    EXPECT_EQ(decoded({1, 1, 32, 0, {}, {1, 2, 3, 4}}), (Bytes{1, 2, 3, 4}));
}

TEST(BmpDecoder, RefusesWhatDoesNotFit) {
    const BmpCase cases[] = {
        {"a run past the row", {2, 1, 8, 1, kFourColors, {3, 1, 0, 1}, 4}, {}},
        {"a row too many", {1, 1, 8, 1, kFourColors, {1, 1, 0, 0, 1, 1, 0, 1}, 4}, {}},
        {"values cut off", {4, 1, 8, 1, kFourColors, {0, 4, 1, 1}, 4}, {}},
        {"a skip cut off", {4, 1, 8, 1, kFourColors, {0, 2}, 4}, {}},
        {"rows cut off", {1, 2, 24, 0, {}, {1, 2, 3, 0, 4, 5, 6}}, {}},
        {"a palette too big", {1, 1, 8, 0, kFourColors, {0, 0, 0, 0}, 257}, {}},
        {"a palette cut off", {1, 1, 8, 0, kFourColors, {0, 0, 0, 0}, 200}, {}},
        {"bits that do not exist", {1, 1, 7, 0, {}, {0, 0, 0, 0}}, {}},
        {"a packing that does not exist", {1, 1, 32, 9, {}, {0, 0, 0, 0}}, {}},
        {"run lengths top down", {1, -1, 8, 1, kFourColors, {1, 1, 0, 1}, 4}, {}},
        {"a mask with a hole",
         {1, 1, 32, 3, {5, 0, 0, 0, 0, 255, 0, 0, 0, 0, 255, 0}, {0, 0, 0, 0}},
         {}},
    };
    for (const BmpCase& entry : cases) {
        EXPECT_EQ(Decoded(Bmp(entry.parts)), Bytes()) << entry.name;
    }
}

struct PngCase {
    const char* name;
    int colorType;
    int bits;
    Bytes row;         // of the picture, which is one row repeated twice
    uint32_t width;    // in pixels
    Bytes expectedRow; // B, G, R, A
};

Bytes Png(const PngCase& entry, int interlace) {
    Bytes file;
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_set_write_fn(
        png, &file,
        [](png_structp self, png_bytep bytes, size_t count) {
            auto& to = *static_cast<Bytes*>(png_get_io_ptr(self));
            to.insert(to.end(), bytes, bytes + count);
        },
        nullptr);
    png_set_IHDR(png, info, entry.width, 2, entry.bits, entry.colorType, interlace,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (entry.colorType == PNG_COLOR_TYPE_PALETTE) {
        constexpr png_color kPalette[] = {{1, 2, 3}, {4, 5, 6}};
        constexpr png_byte kAlpha[] = {200, 0};
        png_set_PLTE(png, info, kPalette, 2);
        png_set_tRNS(png, info, kAlpha, 2, nullptr);
    }
    png_write_info(png, info);
    Bytes row = entry.row;
    for (int pass = png_set_interlace_handling(png); pass-- > 0;) {
        png_write_row(png, row.data());
        png_write_row(png, row.data());
    }
    png_write_end(png, nullptr);
    png_destroy_write_struct(&png, &info);
    return file;
}

TEST(PngDecoder, ReadsEveryKindOfPixel) {
    const PngCase cases[] = {
        {"grey of 1 bit", PNG_COLOR_TYPE_GRAY, 1, {0x40}, 2, {0, 0, 0, 255, 255, 255, 255, 255}},
        {"grey of 8 bits with alpha", PNG_COLOR_TYPE_GRAY_ALPHA, 8, {70, 30}, 1, {70, 70, 70, 30}},
        {"palette with alpha", PNG_COLOR_TYPE_PALETTE, 1, {0x40}, 2, {3, 2, 1, 200, 6, 5, 4, 0}},
        {"colours", PNG_COLOR_TYPE_RGB, 8, {1, 2, 3, 4, 5, 6}, 2, {3, 2, 1, 255, 6, 5, 4, 255}},
        // 16 bits to 8, rounded: 0x8101 / 257 = 128.502, 0x8100 / 257 = 128.498.
        {"16 bits",
         PNG_COLOR_TYPE_RGB_ALPHA,
         16,
         {0x81, 1, 0x81, 0, 0xFF, 0xFF, 0x12, 0x12},
         1,
         {255, 128, 129, 0x12}},
    };
    for (const PngCase& entry : cases) {
        for (const int interlace : {PNG_INTERLACE_NONE, PNG_INTERLACE_ADAM7}) {
            EXPECT_EQ(Decoded(Png(entry, interlace)), Joined(entry.expectedRow, entry.expectedRow))
                << entry.name << ", interlace " << interlace;
        }
    }
}

struct TiffTags {
    const char* name;
    uint16_t photometric = PHOTOMETRIC_RGB;
    uint16_t samples = 4;
    uint16_t bits = 8;
    uint16_t alpha = EXTRASAMPLE_UNASSALPHA; // of the last sample, when there is one
    uint16_t planar = PLANARCONFIG_CONTIG;
    bool isTiled = false;
    uint16_t compression = COMPRESSION_NONE;
};

constexpr int kTiffTile = 16;
constexpr int kTiffWidth = 20; // more than a tile
constexpr int kTiffHeight = 3;

void SetTags(TIFF* tiff, const TiffTags& tags) {
    TIFFSetField(tiff, TIFFTAG_IMAGEWIDTH, kTiffWidth);
    TIFFSetField(tiff, TIFFTAG_IMAGELENGTH, kTiffHeight);
    TIFFSetField(tiff, TIFFTAG_SAMPLESPERPIXEL, tags.samples);
    TIFFSetField(tiff, TIFFTAG_BITSPERSAMPLE, tags.bits);
    TIFFSetField(tiff, TIFFTAG_PHOTOMETRIC, tags.photometric);
    TIFFSetField(tiff, TIFFTAG_PLANARCONFIG, tags.planar);
    TIFFSetField(tiff, TIFFTAG_COMPRESSION, tags.compression);
    const int colors = tags.photometric == PHOTOMETRIC_RGB ? 3 : 1;
    if (tags.samples > colors) {
        TIFFSetField(tiff, TIFFTAG_EXTRASAMPLES, 1, &tags.alpha);
    }
    if (tags.photometric == PHOTOMETRIC_PALETTE) {
        std::array<uint16_t, 256> red{};
        std::array<uint16_t, 256> green{};
        std::array<uint16_t, 256> blue{};
        for (uint16_t i = 0; i < 256; ++i) {
            red[i] = static_cast<uint16_t>(i * 257);
            green[i] = static_cast<uint16_t>((255 - i) * 257);
        }
        TIFFSetField(tiff, TIFFTAG_COLORMAP, red.data(), green.data(), blue.data());
    }
    if (tags.isTiled) {
        TIFFSetField(tiff, TIFFTAG_TILEWIDTH, kTiffTile);
        TIFFSetField(tiff, TIFFTAG_TILELENGTH, kTiffTile);
    } else {
        TIFFSetField(tiff, TIFFTAG_ROWSPERSTRIP, 2);
    }
}

// Writes through the library's file interface; the samples of a pixel are sample(x, y, index).
template <class Sample>
Bytes Tiff(const TiffTags& tags, Sample sample) {
    const kyvtest::CTempFolder folder;
    TIFF* tiff = TIFFOpen(folder.Narrow("a.tif").c_str(), "w");
    EXPECT_NE(tiff, nullptr);
    SetTags(tiff, tags);
    const bool isSeparate = tags.planar == PLANARCONFIG_SEPARATE;
    for (uint16_t plane = 0; plane < (isSeparate ? int{tags.samples} : 1); ++plane) {
        const auto run = [&](int left, int count, int y) {
            Bytes bytes;
            for (int x = left; x < left + count; ++x) {
                for (int s = 0; s < (isSeparate ? 1 : tags.samples); ++s) {
                    Append(bytes, sample(x, y, isSeparate ? plane : s), tags.bits / 8);
                }
            }
            return bytes;
        };
        if (tags.isTiled) {
            for (int left = 0; left < kTiffWidth; left += kTiffTile) {
                Bytes tile;
                for (int y = 0; y < kTiffTile; ++y) {
                    tile = Joined(tile, run(left, kTiffTile, y));
                }
                EXPECT_GE(
                    TIFFWriteTile(tiff, tile.data(), static_cast<uint32_t>(left), 0, 0, plane), 0);
            }
        } else {
            for (int y = 0; y < kTiffHeight; ++y) {
                Bytes row = run(0, kTiffWidth, y);
                EXPECT_EQ(TIFFWriteScanline(tiff, row.data(), static_cast<uint32_t>(y), plane), 1);
            }
        }
    }
    TIFFClose(tiff);
    return folder.Read("a.tif");
}

template <class Pixel>
Bytes TiffPixels(Pixel pixel) {
    Bytes pixels;
    for (int y = 0; y < kTiffHeight; ++y) {
        for (int x = 0; x < kTiffWidth; ++x) {
            const std::array<int, 4> bgra = pixel(x, y);
            for (const int value : bgra) {
                pixels.push_back(static_cast<uint8_t>(value));
            }
        }
    }
    return pixels;
}

TEST(TiffDecoder, KeepsStraightAlphaInEveryLayout) {
    const TiffTags layouts[] = {
        {.name = "strips"},
        {.name = "LZW", .compression = COMPRESSION_LZW},
        {.name = "deflate", .compression = COMPRESSION_ADOBE_DEFLATE},
        {.name = "run lengths", .compression = COMPRESSION_PACKBITS},
        {.name = "planes", .planar = PLANARCONFIG_SEPARATE},
        {.name = "tiles", .isTiled = true},
        {.name = "tiled planes", .planar = PLANARCONFIG_SEPARATE, .isTiled = true},
        {.name = "16 bits", .bits = 16},
        {.name = "a sample more", .samples = 5},
    };
    const auto sample = [](int x, int y, int s) { return (x * 12 + y * 7 + s * 50) & 255; };
    for (const TiffTags& tags : layouts) {
        const Bytes file = Tiff(tags, [&](int x, int y, int s) {
            return static_cast<uint32_t>(sample(x, y, s) * (tags.bits == 16 ? 257 : 1));
        });
        EXPECT_TRUE(Decoded(file) == TiffPixels([&](int x, int y) {
                        return std::array{sample(x, y, 2), sample(x, y, 1), sample(x, y, 0),
                                          sample(x, y, 3)};
                    }))
            << tags.name;
    }
}

TEST(TiffDecoder, ReadsOtherKindsOfPixels) {
    const auto sample = [](int x, int y, int s) {
        return static_cast<uint32_t>(x * 12 + y * 3 + s * 5);
    };
    const auto value = [](int x, int y) { return x * 12 + y * 3; };
    const TiffTags grey = {.name = "grey", .photometric = PHOTOMETRIC_MINISBLACK, .samples = 1};
    EXPECT_TRUE(Decoded(Tiff(grey, sample)) == TiffPixels([&](int x, int y) {
                    const int v = value(x, y);
                    return std::array{v, v, v, 255};
                }));
    const TiffTags inverted = {
        .name = "0 is white", .photometric = PHOTOMETRIC_MINISWHITE, .samples = 2};
    EXPECT_TRUE(Decoded(Tiff(inverted, sample)) == TiffPixels([&](int x, int y) {
                    const int v = 255 - value(x, y);
                    return std::array{v, v, v, value(x, y) + 5};
                }));
    const TiffTags palette = {.name = "palette", .photometric = PHOTOMETRIC_PALETTE, .samples = 1};
    EXPECT_TRUE(Decoded(Tiff(palette, sample)) == TiffPixels([&](int x, int y) {
                    return std::array{0, 255 - value(x, y), value(x, y), 255};
                }));
    const TiffTags opaque = {.name = "colours", .samples = 3};
    EXPECT_TRUE(Decoded(Tiff(opaque, sample)) == TiffPixels([&](int x, int y) {
                    const int v = value(x, y);
                    return std::array{v + 10, v + 5, v, 255};
                }));
    // Premultiplied: red 30 with alpha 60 is 30 * 255 / 60 = 127.5, rounded up; above alpha 255.
    const TiffTags premultiplied = {.name = "premultiplied", .alpha = EXTRASAMPLE_ASSOCALPHA};
    EXPECT_TRUE(Decoded(Tiff(premultiplied, [](int x, int, int s) -> uint32_t {
                    return s == 3 ? (x == 0 ? 0 : 60) : s == 0 ? 30 : s * 60;
                })) == TiffPixels([](int x, int) {
                    return x == 0 ? std::array{120, 60, 30, 0} : std::array{255, 255, 128, 60};
                }));
}

// One small file of every format.
std::vector<std::pair<const char*, Bytes>> SampleFiles() {
    Bytes pixels;
    for (int i = 0; i < 9 * 7 * 4; ++i) {
        pixels.push_back(static_cast<uint8_t>(i * 29));
    }
    const PixelRows rows = {pixels.data(), 9, 7, 36};
    std::vector<std::pair<const char*, Bytes>> files = {
        {"PNG", {}}, {"JPEG", {}}, {"TIFF", {}}, {"BMP", {}}};
    EXPECT_TRUE(EncodePng(rows, files[0].second));
    EXPECT_TRUE(EncodeJpeg(rows, 90, files[1].second));
    EXPECT_TRUE(EncodeTiff(rows, files[2].second));
    EXPECT_TRUE(EncodeBmp(rows, files[3].second));
    return files;
}

TEST(Decoders, RefuseEveryCutOffFile) {
    for (const auto& [name, file] : SampleFiles()) {
        EXPECT_EQ(Decoded(file).size(), size_t{9 * 7 * 4}) << name;
        for (size_t size = 0; size < file.size(); ++size) {
            // A copy of its own, so that reading past its end shows under the sanitizer.
            EXPECT_EQ(Decoded(Bytes(file.begin(), file.begin() + static_cast<ptrdiff_t>(size))),
                      Bytes())
                << name << " cut at " << size;
        }
    }
}

TEST(Decoders, SurviveEveryDamagedByte) {
    for (const auto& [name, file] : SampleFiles()) {
        for (size_t i = 0; i < file.size(); ++i) {
            for (const uint8_t flip : {0x01, 0x80, 0xFF}) {
                Bytes damaged = file;
                damaged[i] ^= flip;
                CPixels target;
                const bool taken = DecodeImage(View(damaged), target);
                // Checksums guard all of a PNG.
                EXPECT_FALSE(taken && file[0] == 0x89) << name << " byte " << i;
                EXPECT_FALSE(taken && target.pixels.empty()) << name << " byte " << i;
            }
        }
    }
}

} // namespace
