// Pictures from the module's resources, against the art they were made from.
#include "imageutility/Bitmap.h"

#include <array>
#include <atomic>
#include <cstring>
#include <fstream>
#include <iterator>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#define STB_IMAGE_IMPLEMENTATION
#define STB_IMAGE_STATIC
#define STBI_ONLY_PNG
#include <stb/stb_image.h>

namespace {

using namespace KYVImageUtility;
using Bytes = std::vector<uint8_t>;

Bytes ReadArt(const std::string& name) {
    std::ifstream file(std::string(KYV_ART_DIR "/") + name, std::ios::binary);
    EXPECT_TRUE(file) << name;
    return {std::istreambuf_iterator<char>(file), {}};
}

Bytes PixelsOf(const CImageARGB& image) {
    EXPECT_EQ(image.GetPitch(), image.GetWidth() * 4);
    return {image.GetBuffer(), image.GetBuffer() + image.GetPixelCount() * 4};
}

// The committed files are bottom up, 8 or 32 bits a pixel, with a header of 54 bytes in front of
// the palette. A palette's fourth byte is 0.
Bytes ExpectedBitmap(const std::string& name, int32_t width, int32_t height) {
    const Bytes file = ReadArt(name);
    const size_t count = static_cast<size_t>(width) * height;
    const size_t palette = 54;
    Bytes pixels;
    const bool indexed = file.at(28) == 8;
    const size_t rows = file.size() - count * (indexed ? 1 : 4);
    for (int32_t y = height; y-- > 0;) {
        for (int32_t x = 0; x < width; ++x) {
            const size_t i = static_cast<size_t>(y) * width + x;
            const size_t at = indexed ? palette + size_t{4} * file.at(rows + i) : rows + i * 4;
            pixels.insert(pixels.end(), &file.at(at), &file.at(at) + 4);
            if (indexed) {
                pixels.back() = 0;
            }
        }
    }
    return pixels;
}

// What a failed load must not change: a view with a level and a decode option.
class CUntouched {
public:
    CUntouched() {
        m_image.Attach(m_pixels.data(), 2, 1, 8);
        m_image.SetCpuLevel(3);
        m_image.SetDecodeOption(77);
    }

    CImageARGB& Image() { return m_image; }

    void Check() const {
        EXPECT_EQ(m_image.GetBuffer(), m_pixels.data());
        EXPECT_EQ(m_image.GetWidth(), 2);
        EXPECT_EQ(m_image.GetHeight(), 1);
        EXPECT_EQ(m_image.GetCpuLevel(), 3);
        EXPECT_EQ(m_image.GetDecodeOption(), 77);
        EXPECT_EQ(m_pixels, (std::array<uint8_t, 8>{1, 2, 3, 4, 5, 6, 7, 8}));
    }

private:
    std::array<uint8_t, 8> m_pixels = {1, 2, 3, 4, 5, 6, 7, 8};
    CImageARGB m_image;
};

struct BitmapCase {
    uint16_t id;
    int32_t width;
    int32_t height;
};

constexpr BitmapCase kBitmaps[] = {
    {140, 640, 480}, {113, 640, 480}, {101, 50, 50},   {135, 50, 50}, {126, 200, 200},
    {127, 200, 200}, {128, 200, 200}, {129, 200, 200}, {130, 64, 64},
};

TEST(BitmapResource, IsTopDownWithPaletteColoursAndAlphaZero) {
    for (const BitmapCase& bitmap : kBitmaps) {
        CImageARGB image;
        image.SetCpuLevel(4);
        LoadBitmapResource(image, kyv::OwnLibrary(), bitmap.id);
        ASSERT_NE(image.GetBuffer(), nullptr) << bitmap.id;
        ASSERT_EQ(image.GetWidth(), bitmap.width);
        ASSERT_EQ(image.GetHeight(), bitmap.height);
        EXPECT_EQ(image.GetCpuLevel(), 4);
        EXPECT_TRUE(PixelsOf(image) == ExpectedBitmap("Bitmap" + std::to_string(bitmap.id) + ".bmp",
                                                      bitmap.width, bitmap.height))
            << bitmap.id;
    }
}

TEST(PngResource, HasTheFilesPixelsWithStraightAlpha) {
    for (const uint16_t id : {141, 142, 143, 145}) {
        const Bytes file = ReadArt("Png" + std::to_string(id) + ".png");
        int width = 0;
        int height = 0;
        int channels = 0;
        stbi_uc* const rgba = stbi_load_from_memory(file.data(), static_cast<int>(file.size()),
                                                    &width, &height, &channels, 4);
        ASSERT_NE(rgba, nullptr) << id;
        CImageARGB image;
        LoadPngResource(image, kyv::OwnLibrary(), "PNG", id);
        ASSERT_NE(image.GetBuffer(), nullptr) << id;
        ASSERT_EQ(image.GetWidth(), width);
        ASSERT_EQ(image.GetHeight(), height);
        EXPECT_EQ(width, id == 145 ? 64 : 200);
        Bytes expected(rgba, rgba + width * height * 4);
        stbi_image_free(rgba);
        for (size_t i = 0; i < expected.size(); i += 4) {
            std::swap(expected[i], expected[i + 2]);
        }
        EXPECT_TRUE(PixelsOf(image) == expected) << id;
    }
}

TEST(PngResource, ReplacesAnImageOfAnotherSize) {
    CImageARGB image(7, 300);
    LoadPngResource(image, kyv::OwnLibrary(), "png", 145); // case is ignored
    EXPECT_EQ(image.GetWidth(), 64);
    EXPECT_EQ(image.GetPitch(), 256);
}

TEST(Resource, MissingOnesLeaveTheDestination) {
    CUntouched destination;
    const kyv::LibraryHandle own = kyv::OwnLibrary();
    LoadPngResource(destination.Image(), own, "PNG", 144);
    LoadPngResource(destination.Image(), own, "PNG", 140); // a bitmap's id
    LoadPngResource(destination.Image(), own, "PNG", 0);
    LoadPngResource(destination.Image(), own, "GIF", 141);
    LoadPngResource(destination.Image(), own, "", 141);
    LoadPngResource(destination.Image(), own, nullptr, 141);
    LoadBitmapResource(destination.Image(), own, 141); // a picture's id
    LoadBitmapResource(destination.Image(), own, 0);
    LoadBitmapResource(destination.Image(), own, 65535);
    BitmapToImage(destination.Image(), nullptr);
    destination.Check();
    EXPECT_EQ(GetBitmapBits32(nullptr, 1, nullptr), 0U);
}

// Instances load their pictures when they begin, each on a thread of its own.
TEST(Resource, LoadsOnSeveralThreadsAtOnce) {
    const Bytes bitmap = ExpectedBitmap("Bitmap140.bmp", 640, 480);
    CImageARGB picture;
    LoadPngResource(picture, kyv::OwnLibrary(), "PNG", 145);
    std::atomic<int> wrong = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < 5; ++round) {
                CImageARGB first;
                CImageARGB second;
                LoadPngResource(first, kyv::OwnLibrary(), "PNG", 145);
                LoadBitmapResource(second, kyv::OwnLibrary(), 140);
                wrong += PixelsOf(first) != PixelsOf(picture) || PixelsOf(second) != bitmap;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
}

TEST(BitmapBits, AreInTheRowOrderAsked) {
    const kyv::BitmapHandle bitmap = kyv::LoadResourceBitmap(kyv::OwnLibrary(), 140);
    ASSERT_NE(bitmap, nullptr);
    const Bytes expected = ExpectedBitmap("Bitmap140.bmp", 640, 480);
    EXPECT_EQ(GetBitmapBits32(bitmap, 1, nullptr), expected.size());
    constexpr size_t kGuard = 64;
    constexpr size_t kRow = 640 * 4;
    for (const int32_t order : {1, 2}) {
        Bytes bits(expected.size() + kGuard, 0xCD);
        uint8_t* pixels = bits.data();
        EXPECT_EQ(GetBitmapBits32(bitmap, order, &pixels), expected.size());
        for (size_t y = 0; y < 480; ++y) {
            const size_t row = order == 1 ? y : 479 - y;
            ASSERT_EQ(std::memcmp(&bits[y * kRow], &expected[row * kRow], kRow), 0)
                << "order " << order << " row " << y;
        }
        EXPECT_TRUE(Bytes(bits.end() - kGuard, bits.end()) == Bytes(kGuard, 0xCD));
    }
    CImageARGB image;
    BitmapToImage(image, bitmap);
    EXPECT_TRUE(PixelsOf(image) == expected);
    kyv::DeleteBitmap(bitmap);
}

} // namespace
