// Picture files written and read back, and files that are damaged.
#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "imageutility/Bitmap.h"
#include "tests/support/PictureFiles.h"

namespace {

namespace fs = std::filesystem;
using namespace KYVImageUtility;
using kyvtest::Bytes;

// Every pixel differs; alpha runs from 0 (with colours below it) to 255.
constexpr int32_t kWidth = 5;
constexpr int32_t kHeight = 3;

Bytes SamplePixels() {
    Bytes pixels;
    for (int i = 0; i < kWidth * kHeight; ++i) {
        pixels.insert(pixels.end(),
                      {static_cast<uint8_t>(10 + 16 * i), static_cast<uint8_t>(250 - 16 * i),
                       static_cast<uint8_t>(i % 2 == 0 ? 255 : 3),
                       static_cast<uint8_t>(i * 255 / 14)});
    }
    return pixels;
}

Bytes WithOpaqueAlpha(Bytes pixels) {
    for (size_t i = 3; i < pixels.size(); i += 4) {
        pixels[i] = 255;
    }
    return pixels;
}

Bytes PixelsOf(const CImageARGB& image) {
    EXPECT_EQ(image.GetPitch(), image.GetWidth() * 4);
    return {image.GetBuffer(), image.GetBuffer() + image.GetPixelCount() * 4};
}

class ImageFile : public testing::Test {
protected:
    // The file's bytes after a save that must succeed.
    Bytes Save(const char* name) {
        EXPECT_EQ(SaveImageFile(m_sample, m_folder.Wide(name).c_str()), 0U) << name;
        return m_folder.Read(name);
    }

    // A file of any content, loaded into an image that remembers its pixels. Each has a name of its
    // own, because GDI+ may hold on to a file that it could not read.
    struct Outcome {
        bool untouched;
        int32_t width;
        int32_t height;
    };

    Outcome LoadBytes(const Bytes& bytes) {
        const std::string name = "picture" + std::to_string(m_nLoaded++);
        m_folder.Write(name.c_str(), bytes);
        std::array<uint8_t, 8> pixels = {1, 2, 3, 4, 5, 6, 7, 8};
        CImageARGB image(pixels.data(), 1, 2, 4);
        LoadImageFile(image, m_folder.Wide(name.c_str()).c_str());
        const bool same = image.GetBuffer() == pixels.data() && image.GetWidth() == 1 &&
                          image.GetHeight() == 2 &&
                          pixels == std::array<uint8_t, 8>{1, 2, 3, 4, 5, 6, 7, 8};
        return {same, image.GetWidth(), image.GetHeight()};
    }

    kyvtest::CTempFolder m_folder;
    Bytes m_pixels = SamplePixels();
    int m_nLoaded = 0;
    CImageARGB m_sample{m_pixels.data(), kWidth, kHeight, kWidth * 4};
};

TEST_F(ImageFile, PngAndTiffKeepStraightAlpha) {
    for (const char* name : {"a.png", "a.tif", "b.TIFF", "c.Png"}) {
        Save(name);
        CImageARGB image;
        LoadImageFile(image, m_folder.Wide(name).c_str());
        ASSERT_EQ(image.GetWidth(), kWidth) << name;
        ASSERT_EQ(image.GetHeight(), kHeight) << name;
        EXPECT_EQ(PixelsOf(image), m_pixels) << name;
    }
}

TEST_F(ImageFile, BmpIsReadAsOpaque) {
    Save("a.BMP");
    CImageARGB image;
    LoadImageFile(image, m_folder.Narrow("a.BMP").c_str()); // by its narrow path
    EXPECT_EQ(PixelsOf(image), WithOpaqueAlpha(m_pixels));
}

TEST_F(ImageFile, JpegIsCloseAndOpaque) {
    constexpr int32_t kSide = 24;
    Bytes pixels;
    for (int32_t i = 0; i < kSide * kSide; ++i) {
        const auto shade = static_cast<uint8_t>(60 + 4 * (i / kSide)); // a gentle slope
        pixels.insert(pixels.end(), {shade, shade, static_cast<uint8_t>(shade + 20), 9});
    }
    const CImageARGB slope(pixels.data(), kSide, kSide, kSide * 4);
    for (const char* name : {"a.jpg", "a.JpEg"}) {
        ASSERT_EQ(SaveImageFile(slope, m_folder.Wide(name).c_str()), 0U);
        CImageARGB image;
        LoadImageFile(image, m_folder.Wide(name).c_str());
        ASSERT_EQ(image.GetWidth(), kSide);
        ASSERT_EQ(image.GetHeight(), kSide);
        for (size_t i = 0; i < pixels.size(); ++i) {
            const int expected = i % 4 == 3 ? 255 : pixels[i];
            ASSERT_NEAR(image.GetBuffer()[i], expected, i % 4 == 3 ? 0 : 8)
                << name << " byte " << i;
        }
    }
}

TEST_F(ImageFile, ViewsAreSavedByTheirPitch) {
    CImageARGB view;
    ASSERT_EQ(m_sample.GetSubImage(view, 1, 1, 3, 2), 1);
    for (const char* name : {"view.png", "view.bmp", "view.tif"}) {
        ASSERT_EQ(SaveImageFile(view, m_folder.Wide(name).c_str()), 0U) << name;
        CImageARGB image;
        LoadImageFile(image, m_folder.Wide(name).c_str());
        ASSERT_EQ(image.GetWidth(), 3) << name;
        ASSERT_EQ(image.GetHeight(), 2) << name;
        for (int32_t y = 0; y < 2; ++y) {
            for (int32_t x = 0; x < 3; ++x) {
                EXPECT_EQ(std::memcmp(image.GetPixelAddress(x, y), view.GetPixelAddress(x, y), 3),
                          0)
                    << name << ' ' << x << ',' << y;
            }
        }
    }
}

TEST_F(ImageFile, SavingReplacesAFile) {
    m_folder.Write("a.png", Bytes(5000, 1));
    EXPECT_LT(Save("a.png").size(), 5000U);
}

TEST_F(ImageFile, ContentTellsTheFormatOfAFileNotItsName) {
    for (const char* name : {"a.png", "a.jpg", "a.tif", "a.bmp"}) {
        const Outcome outcome = LoadBytes(Save(name)); // into a file without an extension
        EXPECT_EQ(outcome.width, kWidth) << name;
        EXPECT_EQ(outcome.height, kHeight) << name;
    }
}

TEST_F(ImageFile, LoadingKeepsLevelAndDecodeOption) {
    Save("a.png");
    CImageARGB image;
    image.SetCpuLevel(4);
    image.SetDecodeOption(-5);
    LoadImageFile(image, m_folder.Wide("a.png").c_str());
    EXPECT_EQ(image.GetWidth(), kWidth);
    EXPECT_EQ(image.GetCpuLevel(), 4);
    EXPECT_EQ(image.GetDecodeOption(), -5);
}

TEST_F(ImageFile, OtherExtensionsFailAndWriteNothing) {
    for (const char* name : {"a.gif", "a", "png", ".pngx", "a.png.txt", "a.tiff2", "a.jp", "a."}) {
        EXPECT_EQ(SaveImageFile(m_sample, m_folder.Wide(name).c_str()), 0x80004005U) << name;
        EXPECT_FALSE(fs::exists(m_folder.Path(name))) << name;
    }
    EXPECT_EQ(SaveImageFile(m_sample, L""), 0x80004005U);
    EXPECT_EQ(SaveImageFile(m_sample, nullptr), 0x80004005U);
}

TEST_F(ImageFile, WhatCannotBeWrittenFails) {
    EXPECT_EQ(SaveImageFile(CImageARGB(), m_folder.Wide("a.png").c_str()), 0x80004005U);
    EXPECT_FALSE(fs::exists(m_folder.Path("a.png")));
    EXPECT_EQ(SaveImageFile(m_sample, m_folder.Wide("no/such/a.png").c_str()), 0x80004005U);
    fs::create_directory(m_folder.Path("folder.png"));
    EXPECT_EQ(SaveImageFile(m_sample, m_folder.Wide("folder.png").c_str()), 0x80004005U);
}

TEST_F(ImageFile, WhatIsNoPictureLeavesTheDestination) {
    std::array<uint8_t, 4> pixel = {1, 2, 3, 4};
    CImageARGB image(pixel.data(), 1, 1, 4);
    fs::create_directory(m_folder.Path("folder"));
    m_folder.Write("empty", {});
    m_folder.Write("text.png", Bytes(3000, 'x'));
    for (const char* name : {"missing.png", "folder", "empty", "text.png", "no/such/folder.bmp"}) {
        LoadImageFile(image, m_folder.Wide(name).c_str());
        LoadImageFile(image, m_folder.Narrow(name).c_str());
    }
    LoadImageFile(image, L"");
    LoadImageFile(image, "");
    LoadImageFile(image, std::wstring(70000, L'a').c_str());
    LoadImageFile(image, std::string(70000, 'a').c_str());
    LoadImageFile(image, static_cast<const wchar_t*>(nullptr));
    LoadImageFile(image, static_cast<const char*>(nullptr));
    EXPECT_EQ(image.GetBuffer(), pixel.data());
    EXPECT_EQ(pixel, (std::array<uint8_t, 4>{1, 2, 3, 4}));
}

// A file that is cut off either counts for nothing or gives an image of the right size: readers
// that mend a damaged file are not ours to change.
TEST_F(ImageFile, CutOffFilesGiveNothingOrAWholeImage) {
    for (const char* name : {"a.png", "a.jpg", "a.tif", "a.bmp"}) {
        const Bytes file = Save(name);
        for (size_t size = 0; size < file.size(); size += 1 + file.size() / 12) {
            const Outcome outcome = LoadBytes(Bytes(file.begin(), file.begin() + size));
            EXPECT_TRUE(outcome.untouched || (outcome.width == kWidth && outcome.height == kHeight))
                << name << " cut at " << size << ": " << outcome.width << 'x' << outcome.height;
        }
    }
}

TEST_F(ImageFile, AbsurdSizesLeaveTheDestination) {
    struct Size {
        uint32_t width;
        uint32_t height;
    };
    constexpr Size kSizes[] = {
        {0, 3},          {5, 0},          {0, 0},          {40000, 40000},
        {65535, 65535},  {0x7FFFFFFF, 1}, {1, 0x7FFFFFFF}, {0x80000000, 3},
        {5, 0x80000000}, {0xFFFFFFFF, 1}, {0x40000001, 4}, {0x7FFFFFFF, 0x7FFFFFFF},
    };
    for (const char* name : {"a.png", "a.jpg", "a.tif", "a.bmp"}) {
        const Bytes file = Save(name);
        for (const auto& [width, height] : kSizes) {
            if (width > 65535 && file[0] == 0xFF) {
                break; // more than a JPEG can state
            }
            const Outcome outcome = LoadBytes(kyvtest::WithSize(file, width, height));
            EXPECT_TRUE(outcome.untouched) << name << ' ' << width << 'x' << height << " gives "
                                           << outcome.width << 'x' << outcome.height;
        }
    }
}

} // namespace
